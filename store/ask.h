// One statement of our own on a database file, where the library has no operation for it.
#ifndef STORE_ASK_H
#define STORE_ASK_H

#include <string>
#include <vector>

namespace quor::store {

// The texts of one column of the result. Failure with SQLite's cause and what to do about it.
std::vector<std::string> Ask(const std::string& db, const std::string& sql, const char* column);

// Failure when the table is not there: several readers of the library cannot tell that from an empty one.
void RequireTable(const std::string& db, const std::string& table);

}  // namespace quor::store

#endif
