// The connection behind the handle that callers hold.
#ifndef PLATFORM_DB_CONNECTION_H
#define PLATFORM_DB_CONNECTION_H

#include <sqlite3.h>

#include <string>

#include "base/guards.h"
#include "quor/quordb.h"

namespace quor {

using Database = Guard<sqlite3, sqlite3_close_v2>;  // statements of its own may still be open

// A path as SQLite takes it for nothing else: some relative names are a URI or a database in memory to it.
std::string PlainName(const char* path);

}  // namespace quor

struct DBConnect_tag {
    quor::Descriptor quiet;  // held until the database is closed; mostly none
    quor::Database db;
};

#endif
