#include <syslog.h>

#include "common.h"
#include "dbutil/query.h"

namespace {

// Runs `sql` on the database; `line` stands in the report of an invalid path. False on failure.
bool readStatistics(const std::string& path, int line, const std::string& sql, quor::Query& query) {
    return quor::CheckDbPath(path, line) && query.connect(path) && query.execute(sql) >= 0;
}

// The count in the first row; 0 when there is none.
uint64_t firstCount(const quor::Query& query, const char* column) {
    unsigned int row = 0;
    return QUORDBFetchRow(query.result.get(), &row) < 0 ? 0 : quor::ToUint64(query.text(row, column));
}

// The number as the statements carry it: negative ones appear modulo 2^64.
std::string sqlNumber(int value) {
    return ullNumberToString(static_cast<unsigned long long>(value));
}

// Rows arrive in the order of their stamps and, within a stamp, of their devices: the end is the place to look first.
void addSample(std::map<int32_t, SYSLOG_LOG_EPS>& samples, int32_t stamp, const char* device, int32_t count) {
    const bool same = !samples.empty() && samples.rbegin()->first == stamp;
    SYSLOG_LOG_EPS& sample = same ? samples.rbegin()->second : samples.try_emplace(samples.end(), stamp)->second;
    sample.stamp = stamp;
    sample.eps += static_cast<unsigned long long>(count);
    sample.devices.emplace_hint(sample.devices.end(), device, count);
}

}  // namespace

uint32_t SyslogDBVersionGet(std::string& path) {
    if (!quor::IsValidDbPath(path)) {
        syslog(LOG_ERR, "%s:%d Invalid syslog db path! [%s]", "dbutil", 853, path.c_str());
        return 1;
    }
    quor::Query query;
    return query.connect(path) && query.execute("SELECT * FROM db_info") < 0 ? 2 : 1;
}

unsigned long long SyslogDBHistTotalGet(std::string& path) {
    quor::Query query;
    return readStatistics(path, 1051, "SELECT SUM(count) FROM histogram", query) ? firstCount(query, "SUM(count)") : 0;
}

unsigned long long SyslogDBHistGetSingle(std::string& path, std::string device) {
    quor::Query query;
    const std::string sql = "SELECT * FROM histogram WHERE device = '" + device + "'";
    return readStatistics(path, 1092, sql, query) ? firstCount(query, "count") : 0;
}

std::map<std::string, unsigned long long> SyslogDBHistGet(std::string& path, int limit) {
    std::map<std::string, unsigned long long> counts;
    std::string sql = "SELECT * FROM histogram";
    if (limit != 0) {
        sql += " ORDER BY count DESC LIMIT " + sqlNumber(limit);
    }
    quor::Query query;
    if (readStatistics(path, 1134, sql, query)) {
        (void)query.eachRow([&](unsigned int row) {  // a row that cannot be fetched ends the list
            counts.emplace_hint(counts.end(), query.text(row, "device"), quor::ToUint64(query.text(row, "count")));
        });
    }
    return counts;
}

std::map<int32_t, SYSLOG_LOG_EPS> SyslogDBEpsGet(std::string& path, int from, int to) {
    std::map<int32_t, SYSLOG_LOG_EPS> samples;
    const std::string sql = "SELECT * FROM eps WHERE stamp >=" + sqlNumber(from) + " and stamp <=" + sqlNumber(to);
    quor::Query query;
    if (readStatistics(path, 982, sql, query)) {
        (void)query.eachRow([&](unsigned int row) {
            addSample(samples, quor::ToInt32(query.text(row, "stamp")), query.text(row, "device"),
                      quor::ToInt32(query.text(row, "eps")));
        });
    }
    return samples;
}
