// One statement of our own on a database file, where the library has no operation for it.
#ifndef STORE_ASK_H
#define STORE_ASK_H

#include <string>
#include <vector>

#include "common/handles.h"
#include "dbutil.h"

namespace quor::store {

// An open database. Failure with what to do about it.
Connection Connect(const std::string& db);

// The whole result of one statement; with a limit, of the rows in that window. Failure with SQLite's cause and what to
// do about it, which names the database as `db`.
Result Execute(const Connection& connection, const std::string& db, const std::string& sql,
               const _SYSLOG_SQL_LIMIT_tag* limit = nullptr);

// The texts of one column of the result. Fails as these do.
std::vector<std::string> Ask(const std::string& db, const std::string& sql, const char* column);

// The text as a literal of a statement.
std::string Literal(const std::string& text);

// Failure when the table is not there: several readers of the library cannot tell that from an empty one.
void RequireTable(const std::string& db, const std::string& table);

}  // namespace quor::store

#endif
