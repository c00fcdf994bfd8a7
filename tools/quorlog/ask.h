// One statement of our own on a database, where the library has no operation for it.
#ifndef QUORLOG_ASK_H
#define QUORLOG_ASK_H

#include <string>
#include <vector>

namespace quor::cli {

// The texts of one column of the result. QueryFailure with the cause and what to do about it.
std::vector<std::string> Ask(const std::string& db, const std::string& sql, const char* column);

// QueryFailure when the table is not there: several readers of the library cannot tell that from an empty one.
void RequireTable(const std::string& db, const std::string& table);

}  // namespace quor::cli

#endif
