// Who did what to the logs, for the event log.
#ifndef QUORLOG_DEEDS_H
#define QUORLOG_DEEDS_H

#include <string>

namespace quor::cli {

// The user who runs the program, behind sudo as well.
std::string UserName();

void RecordDeed(const std::string& deed);

}  // namespace quor::cli

#endif
