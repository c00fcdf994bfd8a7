// One statement on a connection of its own, as every call of the query layer runs it.
#ifndef DBUTIL_QUERY_H
#define DBUTIL_QUERY_H

#include <syslog.h>

#include <string>
#include <utility>

#include "common/handles.h"
#include "common/logplaces.h"
#include "dbutil.h"

namespace quor {

// Only absolute paths are taken.
inline bool IsValidDbPath(const std::string& path) {
    return !path.empty() && path.front() == '/';
}

// The same, with a report when it is not; `place` is one of common/logplaces.h.
inline bool CheckDbPath(const std::string& path, int place) {
    if (!IsValidDbPath(path)) {
        syslog(LOG_ERR, "%s:%d Invalid syslog db path!", "dbutil", place);
        return false;
    }
    return true;
}

// Owns the connection and what came back; the result goes before the connection.
struct Query {
    Connection connection;
    Result result;

    // False when the database cannot be opened.
    bool connect(const std::string& path) {
        connection.reset(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str()));
        return connection != nullptr;
    }

    // Negative on failure.
    int execute(const std::string& sql) {
        result.reset();
        return QUORDBExecute(connection.get(), sql.c_str(), Adopt(result));
    }

    // Through the wrapper's limited select, which takes the low 32 bits, when there is a limit.
    int execute(const std::string& sql, const _SYSLOG_SQL_LIMIT_tag* limit) {
        if (limit == nullptr) {
            return execute(sql);
        }
        result.reset();
        return QUORDBSelectLimit(connection.get(), sql.c_str(), static_cast<uint32_t>(limit->limit),
                                 static_cast<uint32_t>(limit->offset), Adopt(result));
    }

    // Hands one row after the other to `visit(const Row&)` until it answers false. False when a row cannot be fetched.
    template <typename Visit>
    bool eachRow(Visit visit) const {
        const int count = QUORDBNumRows(result.get());
        bool more = true;
        Row row(result.get());
        for (int i = 0; i < count && more; ++i) {
            if (!row.next()) {
                return false;
            }
            more = visit(std::as_const(row));
        }
        return true;
    }
};

}  // namespace quor

#endif
