// What the process has to say for itself, besides the system log.
#ifndef QUORLOGD_ANNOUNCE_H
#define QUORLOGD_ANNOUNCE_H

#include <map>
#include <string>

namespace quor {

// Both report their own failures. The text may hold names and texts of strangers as they are.
void RecordEvent(const std::string& text);
void SendNotice(const char* tag, const std::map<std::string, std::string>& values);

}  // namespace quor

#endif
