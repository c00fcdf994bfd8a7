// The connection behind the handle that callers hold.
#ifndef PLATFORM_DB_CONNECTION_H
#define PLATFORM_DB_CONNECTION_H

#include <sqlite3.h>

#include "quor/quordb.h"

struct DBConnect_tag {
    sqlite3* db = nullptr;

    DBConnect_tag() = default;
    DBConnect_tag(const DBConnect_tag&) = delete;
    DBConnect_tag& operator=(const DBConnect_tag&) = delete;
    ~DBConnect_tag() { sqlite3_close_v2(db); }  // also ends a handle with statements of the caller's own
};

#endif
