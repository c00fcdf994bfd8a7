// Command lines for the database shell.
#ifndef DBHANDLER_SHELL_H
#define DBHANDLER_SHELL_H

#include <string>

#include "base/paths.h"
#include "quor/quorcore.h"

namespace quor {

// Switches a database, given as the shell is to read its path, to write-ahead journaling.
inline std::string WalCommand(const std::string& path) {
    return std::string(paths::kSqliteShell) + " " + path + " \"PRAGMA journal_mode=WAL;\"";
}

// False when the shell could not be run. What the command itself came to is not looked at.
inline bool RunShell(const std::string& command) {
    constexpr const char* kEnd = nullptr;
    return QLIBCExec(paths::kShell, "-c", command.c_str(), kEnd, kEnd) >= 0;
}

}  // namespace quor

#endif
