// Statements of a database that is made here. Memory that runs out is no fault of a definition or of a row, which could
// be left out: std::bad_alloc then, and everything fails.
#ifndef PLATFORM_SALVAGE_SQL_H
#define PLATFORM_SALVAGE_SQL_H

#include <sqlite3.h>

#include <string>

#include "platform/db/connection.h"
#include "platform/db/statement.h"

namespace quor::salvage {

// In memory, and empty.
Database OpenScratch();

// Hands a status on.
int WithMemory(int status);

// Null for a statement that is wrong.
Statement Prepare(sqlite3* db, const std::string& sql);
// Whether there is another row; never of a null statement.
bool NextRow(const Statement& query);
// Empty for NULL.
std::string TextOf(const Statement& query, int column);

// A name in double quotes.
std::string Quoted(const std::string& name);

}  // namespace quor::salvage

#endif
