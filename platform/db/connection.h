// The connection behind the handle that callers hold.
#ifndef PLATFORM_DB_CONNECTION_H
#define PLATFORM_DB_CONNECTION_H

#include <sqlite3.h>

#include "base/guards.h"
#include "quor/quordb.h"

namespace quor {

using Database = Guard<sqlite3, sqlite3_close_v2>;  // statements of its own may still be open

}  // namespace quor

struct DBConnect_tag {
    quor::Descriptor quiet;  // held until the database is closed; mostly none
    quor::Database db;
};

#endif
