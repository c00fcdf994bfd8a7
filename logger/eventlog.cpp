#include <ctime>

#include "base/numbers.h"
#include "dbutil/query.h"
#include "logger.h"
#include "logger/eventdb.h"

namespace {

constexpr int kRotationRows = 20000;
constexpr unsigned long long kRowsWanted = 18000;

// Nothing inside is escaped.
std::string quoted(const std::string& value) {
    return "'" + value + "'";
}

bool succeeded(int result, const std::string& statement) {
    if (result < 0) {
        Debuger::MSG(0, "Fail to execute SQL command: " + statement);
        return false;
    }
    return true;
}

int readTime(DBResult_tag* result, void* context) {
    *static_cast<int32_t*>(context) = quor::ToInt32(quor::Row(result)["time"]);
    return 0;
}

// The number of rows in the only row of the result.
int readCount(const quor::Query& query) {
    quor::Row row(query.result.get());
    if (!row.next()) {
        Debuger::MSG(0, "Fail to fetch row");
        return -1;
    }
    if (QUORDBNumRows(query.result.get()) != 1) {
        return -2;
    }
    return static_cast<int32_t>(quor::ToInt64(row["COUNT(*)"]));
}

}  // namespace

Logger::Logger() = default;

Logger::~Logger() = default;

int Logger::LogAdd(std::string dbPath, int level, std::string user, std::string event) {
    quor::EventDb db(dbPath);
    if (!db.connect()) {
        return -1;
    }
    (void)db->DBTranStart();  // without it the INSERT is a transaction of its own
    const std::string now = quor::WrappedDecimal(static_cast<int32_t>(time(nullptr)));
    const std::string statement = "INSERT INTO log VALUES(NULL," + quoted(quor::WrappedDecimal(level)) + "," +
                                  quoted(now) + "," + quoted(user) + "," + quoted(event) + ");";
    if (!succeeded(db->DBExecute(statement), statement)) {
        return -1;
    }
    (void)db->DBTranEnd();
    if (LogRotation(dbPath) < 0) {
        Debuger::MSG(0, "Fail to rotate log database");
    }
    return 0;
}

int Logger::LogCount(std::string dbPath) {
    if (!quor::IsValidDbPath(dbPath)) {
        Debuger::MSG(0, "Invalid syslog db path!");
        return -1;
    }
    quor::Query query;
    if (!query.connect(dbPath)) {
        Debuger::MSG(0, "Fail to connect syslog log database");
        return -1;
    }
    if (query.execute("SELECT COUNT(*) FROM log") < 0) {
        Debuger::MSG(0, "Fail to select syslog log database");
        return -1;
    }
    return readCount(query);
}

int Logger::LogRotation(std::string dbPath) {
    if (LogCount(dbPath) < kRotationRows) {
        return 0;
    }
    quor::EventDb db(dbPath);
    if (!db.connect()) {
        return -1;
    }
    int32_t oldestWanted = 0;  // the bound of the DELETE is 0 all the same: events with a time are never removed
    const std::string select =
        "SELECT time FROM log ORDER BY time DESC LIMIT 1 OFFSET " + ullNumberToString(kRowsWanted);
    if (!succeeded(db->DBExecute(select, readTime, &oldestWanted), select)) {
        return -1;
    }
    for (const char* statement : {"DELETE FROM log WHERE time <= 0", "VACUUM"}) {
        if (!succeeded(db->DBExecute(statement), statement)) {
            return -1;
        }
    }
    return 0;
}
