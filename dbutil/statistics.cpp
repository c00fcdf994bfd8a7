#include <syslog.h>

#include "dbutil/query.h"

namespace {

// Runs `sql` on the database; `place` is in the report of an invalid path. False on failure.
bool readStatistics(const std::string& path, int place, const std::string& sql, quor::Query& query) {
    return quor::CheckDbPath(path, place) && query.connect(path) && query.execute(sql) >= 0;
}

// The count in the first row; 0 when there is none.
uint64_t firstCount(const quor::Query& query, const char* column) {
    quor::Row row(query.result.get());
    return row.next() ? quor::ToUint64(row[column]) : 0;
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
        syslog(LOG_ERR, "%s:%d Invalid syslog db path! [%s]", "dbutil", quor::place::kVersionPath, path.c_str());
        return 1;
    }
    quor::Query query;
    return query.connect(path) && query.execute("SELECT * FROM db_info") < 0 ? 2 : 1;
}

unsigned long long SyslogDBHistTotalGet(std::string& path) {
    quor::Query query;
    return readStatistics(path, quor::place::kTotalPath, "SELECT SUM(count) FROM histogram", query)
               ? firstCount(query, "SUM(count)")
               : 0;
}

unsigned long long SyslogDBHistGetSingle(std::string& path, std::string device) {
    quor::Query query;
    const std::string sql = "SELECT * FROM histogram WHERE device = '" + device + "'";
    return readStatistics(path, quor::place::kDevicePath, sql, query) ? firstCount(query, "count") : 0;
}

std::map<std::string, unsigned long long> SyslogDBHistGet(std::string& path, int limit) {
    std::map<std::string, unsigned long long> counts;
    std::string sql = "SELECT * FROM histogram";
    if (limit != 0) {
        sql += " ORDER BY count DESC LIMIT " + quor::WrappedDecimal(limit);
    }
    quor::Query query;
    if (readStatistics(path, quor::place::kHistogramPath, sql, query)) {
        (void)query.eachRow([&](const quor::Row& row) {  // a row that cannot be fetched ends the list
            counts.emplace_hint(counts.end(), row["device"], quor::ToUint64(row["count"]));
            return true;
        });
    }
    return counts;
}

std::map<int32_t, SYSLOG_LOG_EPS> SyslogDBEpsGet(std::string& path, int from, int to) {
    std::map<int32_t, SYSLOG_LOG_EPS> samples;
    const std::string sql =
        "SELECT * FROM eps WHERE stamp >=" + quor::WrappedDecimal(from) + " and stamp <=" + quor::WrappedDecimal(to);
    quor::Query query;
    if (readStatistics(path, quor::place::kSamplesPath, sql, query)) {
        (void)query.eachRow([&](const quor::Row& row) {
            addSample(samples, quor::ToInt32(row["stamp"]), row["device"], quor::ToInt32(row["eps"]));
            return true;
        });
    }
    return samples;
}
