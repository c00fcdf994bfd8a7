// One statement from a text that may have been put together from hostile parts.
#ifndef PLATFORM_DB_STATEMENT_H
#define PLATFORM_DB_STATEMENT_H

#include <sqlite3.h>

#include <cstdint>
#include <string>

#include "base/guards.h"

namespace quor {

using Statement = Guard<sqlite3_stmt, sqlite3_finalize>;

// The only statement of the text. Null, with the error on the handle, when it is wrong, absent or followed by more.
Statement PrepareOnly(sqlite3* db, const char* sql);

// The text of a SELECT with its window put behind the statement itself, before what follows it. A count of 0 is no
// limit.
std::string WithWindow(const char* sql, uint32_t count, uint32_t skip);

// Makes `code` and `text` the last error of the handle.
void SetError(sqlite3* db, int code, const char* text);

}  // namespace quor

#endif
