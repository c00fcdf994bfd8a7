// The database file that a command works on, and questions to the person before something is destroyed.
#ifndef QUORLOG_DATABASE_H
#define QUORLOG_DATABASE_H

#include <string>

namespace quor::cli {

// The path made absolute, as the library wants it.
std::string AbsolutePath(const std::string& path);

// The absolute path of a database that exists; Failure otherwise, with `advice` on how to get one.
std::string RequireDatabase(const std::string& path, const std::string& advice);
// The same for a log database.
std::string RequireLogDatabase(const std::string& path);

// Asks on standard error; true for "y" or "yes". Failure when standard input has no answer.
bool Confirm(const std::string& question);

}  // namespace quor::cli

#endif
