#include <syslog.h>

#include "common.h"
#include "common/errorcode.h"
#include "common/logplaces.h"
#include "dbhandler.h"
#include "dbhandler/readers.h"
#include "quor/quordb.h"

namespace {

std::string tableQuery(const std::string& table) {
    return "SELECT count(*) as count_result FROM sqlite_master WHERE type='table' AND name='" + table + "'";
}

}  // namespace

int DBHandler::DBcheckTableExist(std::string table) {
    const std::string sql = tableQuery(table);
    _ARCH_DB_INFO_tag info;
    if (DBExecute(sql, quor::ReadCount, &info) != 0) {
        Debuger::MSG(0, "Fail to execute SQL command : " + sql);
        return 0;
    }
    return info.log_count != 0 ? 1 : 0;
}

void DBHandler::DBErrorHandle(std::string sql) {
    constexpr const char* kLogs = "logs";
    const int code = quor::ErrorCode(connection_);
    const std::string cause = QUORDBErrorGet(connection_);  // before the table check replaces it
    int priority = LOG_ERR;
    switch (code) {
    case SQLITE_ERROR:
        // A failed table check is not followed by another one, which would fail the same way without end.
        if (sql != tableQuery(kLogs) && DBcheckTableExist(kLogs) != 0) {
            priority = LOG_INFO;
        }
        break;
    case SQLITE_CORRUPT:
        (void)DBErrorHandle_SQLITE_CORRUPT(connection_, dbPath_);  // it reports its own failures
        break;
    case SQLITE_BUSY:
    case SQLITE_EMPTY:
    case SQLITE_NOTADB:
        priority = LOG_INFO;  // expected while syslog-ng writes, and of files that are not databases
        break;
    default:
        break;
    }
    syslog(priority, "%s:%d Fail to execute SQL command: %s, error code is : %d, error cause: %s", "dbhandler",
           quor::place::kStatementFailed, sql.c_str(), code, cause.c_str());
}
