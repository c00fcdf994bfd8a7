// SQLite's code of the last failure on a connection of the platform's wrapper.
#ifndef COMMON_ERRORCODE_H
#define COMMON_ERRORCODE_H

#include <sqlite3.h>

#include "quor/quordb.h"

namespace quor {

inline int ErrorCode(DBConnect_tag* connection) {
    return sqlite3_errcode(static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection)));
}

}  // namespace quor

#endif
