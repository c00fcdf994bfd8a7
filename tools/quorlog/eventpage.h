// The events as an HTML page in which every text is only text.
#ifndef QUORLOG_EVENTPAGE_H
#define QUORLOG_EVENTPAGE_H

#include <list>
#include <string>

#include "logger.h"

namespace quor::cli {

// Failure when the file cannot be opened for writing; it is created empty, or emptied.
void RequireWritable(const std::string& path);

void WriteEventPage(const std::list<_SSYSLOG_LOG_LOG_tag>& events, const std::string& path);

}  // namespace quor::cli

#endif
