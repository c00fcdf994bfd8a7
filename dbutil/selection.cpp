#include <syslog.h>

#include "common.h"
#include "dbutil.h"
#include "dbutil/query.h"

namespace {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;
using RecordCallback = int (*)(_SYSLOG_LOG_DATA_tag&, void*);

// What an empty search word renders to; it matches every row.
constexpr const char kMatchAll[] = "(msg GLOB '**')";

constexpr const char kLogs[] = "logs";

bool isUnfiltered(const std::string& where) {
    return where.empty() || where == kMatchAll;
}

// The newest `limit` ids after the `offset` newest.
std::string idWindow(const _SYSLOG_SQL_LIMIT_tag& window) {
    return "( id > totalCount - " + ullNumberToString(window.limit + window.offset) + " AND id <= totalCount - " +
           ullNumberToString(window.offset) + ")";
}

std::string orderBy(const _SYSLOG_SQL_ORDER_tag* order) {
    if (order == nullptr) {
        return {};
    }
    return std::string(" ORDER BY ") + LogAttriStrGet(order->attr) + (order->asc != 0 ? " asc" : " desc");
}

std::string whereClause(const std::string& where) {
    return where.empty() ? where : " WHERE " + where;
}

// An unfiltered page asks for a range of ids, which the table finds without a scan whatever its size.
std::string selectStatement(const std::string& table, const std::string& where, const _SYSLOG_SQL_LIMIT_tag* limit,
                            const _SYSLOG_SQL_ORDER_tag* order) {
    if (limit == nullptr || limit->limit == 0 || !isUnfiltered(where)) {
        return "SELECT * FROM " + table + whereClause(where) + orderBy(order);
    }
    return "SELECT *, (SELECT max(rowid) FROM " + table + ") totalCount FROM " + table + whereClause(where) +
           (where.empty() ? " WHERE " : " AND ") + idWindow(*limit) + orderBy(order);
}

// Hands every row over until the callback or a row that cannot be converted ends the walk. False when a row is missing.
bool walkRows(const quor::Query& query, std::string& table, RecordCallback callback, void* ctx, bool trim) {
    _SYSLOG_LOG_DATA_tag record;
    return query.eachRow([&](const quor::Row& row) {
        return callback == nullptr || (DBRecToLogInfo(table, query.result.get(), row.number(), &record, trim) == 0 &&
                                       callback(record, ctx) == 0);
    });
}

}  // namespace

int SyslogDBSelectByTable(std::string& dbPath, std::string& table, Conditions& conds, _SYSLOG_SQL_LIMIT_tag* limit,
                          _SYSLOG_SQL_ORDER_tag* order, RecordCallback callback, void* ctx, bool trim) {
    if (!quor::CheckDbPath(dbPath, quor::place::kSelectPath)) {
        return -1;
    }
    std::string where;
    if (SqlCondListToStr(conds, where) != 0) {
        syslog(LOG_ERR, "fail to get sql condition list");
        return -1;
    }
    const std::string sql = selectStatement(table, where, limit, order);
    quor::Query query;
    if (!query.connect(dbPath)) {
        syslog(LOG_ERR, "fail to connect database (%s)", dbPath.c_str());
        return -1;
    }
    if (query.execute(sql, isUnfiltered(where) ? nullptr : limit) < 0) {
        syslog(LOG_ERR, "fail to execute database command (%s)", sql.c_str());
        return -1;
    }
    return walkRows(query, table, callback, ctx, trim) ? 0 : -1;
}

int SyslogDBSelect(std::string& dbPath, Conditions& conds, _SYSLOG_SQL_LIMIT_tag* limit, _SYSLOG_SQL_ORDER_tag* order,
                   RecordCallback callback, void* ctx, bool trim) {
    std::string table = kLogs;
    return SyslogDBSelectByTable(dbPath, table, conds, limit, order, callback, ctx, trim);
}

int SyslogDBSelectCountByTable(std::string& dbPath, std::string& table, Conditions& conds, _SYSLOG_SQL_LIMIT_tag* limit,
                               _SYSLOG_SQL_ORDER_tag* order) {
    constexpr int kNotOneRow = -2;
    if (!quor::CheckDbPath(dbPath, quor::place::kCountPath)) {
        return -1;
    }
    std::string where;
    if (SqlCondListToStr(conds, where) != 0) {
        return -1;
    }
    const std::string counted = isUnfiltered(where) ? "max(rowid)" : "COUNT(*)";
    const std::string sql = "SELECT " + counted + " FROM " + table + whereClause(where) + orderBy(order);
    quor::Query query;
    if (!query.connect(dbPath) || query.execute(sql, limit) < 0) {
        return -1;
    }
    quor::Row row(query.result.get());
    if (!row.next()) {
        return -1;
    }
    if (QUORDBNumRows(query.result.get()) != 1) {
        return kNotOneRow;
    }
    return static_cast<int32_t>(static_cast<uint32_t>(quor::ToInt64(row[counted.c_str()])));
}

int SyslogDBSelectCount(std::string& dbPath, Conditions& conds, _SYSLOG_SQL_LIMIT_tag* limit,
                        _SYSLOG_SQL_ORDER_tag* order) {
    std::string table = kLogs;
    return SyslogDBSelectCountByTable(dbPath, table, conds, limit, order);
}

int SyslogDBDelete(std::string& dbPath, Conditions& conds) {
    if (!quor::CheckDbPath(dbPath, quor::place::kDeletePath)) {
        return -1;
    }
    std::string where;
    if (SqlCondListToStr(conds, where) != 0) {
        return -1;
    }
    const std::string sql = "DELETE FROM logs" + whereClause(where);
    const quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, dbPath.c_str()));
    return connection != nullptr && QUORDBExecute(connection.get(), sql.c_str(), nullptr) >= 0 ? 0 : -1;
}
