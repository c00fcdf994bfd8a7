#include <sqlite3.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>

#include "base/paths.h"
#include "bench/receive/measure.h"
#include "dbutil.h"

namespace quor::bench {
namespace {

constexpr int kFirst = 1795000000;
constexpr int kStep = 10;  // seconds between two samples, over 30 days
constexpr int kSamples = 30 * 86400 / kStep;

struct Closer {
    void operator()(sqlite3* db) const { (void)sqlite3_close(db); }
    void operator()(sqlite3_stmt* statement) const { (void)sqlite3_finalize(statement); }
};
using Database = std::unique_ptr<sqlite3, Closer>;
using Statement = std::unique_ptr<sqlite3_stmt, Closer>;

Database openDatabase(const std::string& path) {
    sqlite3* db = nullptr;
    (void)sqlite3_open(path.c_str(), &db);
    return Database(db);
}

// The same work written by hand for one statement: its own connection, and a row at a time.
template <typename Row>
void readPlainly(const std::string& path, const char* sql, Row row) {
    const Database db = openDatabase(path);
    sqlite3_stmt* prepared = nullptr;
    (void)sqlite3_prepare_v2(db.get(), sql, -1, &prepared, nullptr);
    const Statement statement(prepared);
    while (sqlite3_step(prepared) == SQLITE_ROW) {
        row(prepared);
    }
}

const char* text(sqlite3_stmt* row, int column) {
    return reinterpret_cast<const char*>(sqlite3_column_text(row, column));
}

std::string makeDatabase() {
    std::string path = std::filesystem::temp_directory_path() / "quor-bench-statistics.db";
    std::filesystem::remove(path);
    std::ifstream schema(paths::kAccountingSchema);
    const std::string sql{std::istreambuf_iterator<char>(schema), {}};
    const std::string fill =
        "PRAGMA journal_mode=OFF; PRAGMA synchronous=OFF; BEGIN;"
        "WITH RECURSIVE s(n) AS (SELECT 0 UNION ALL SELECT n + 1 FROM s WHERE n + 1 < " +
        std::to_string(kSamples) +
        "), d(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM d WHERE k < 19)"
        "INSERT INTO eps SELECT NULL, " +
        std::to_string(kFirst) + " + n * " + std::to_string(kStep) +
        ", printf('router%02d.example.net', k), n % 97 + k FROM s, d;"
        "WITH RECURSIVE d(k) AS (SELECT 0 UNION ALL SELECT k + 1 FROM d WHERE k < 9999)"
        "INSERT INTO histogram SELECT NULL, printf('router%05d.example.net', k), k * 31 FROM d; COMMIT;";
    const Database db = openDatabase(path);
    (void)sqlite3_exec(db.get(), (sql + fill).c_str(), nullptr, nullptr, nullptr);
    return path;
}

void measureSamples(std::string& path) {
    const int from = kFirst + 15 * 86400;
    const std::string sql =
        "SELECT * FROM eps WHERE stamp >=" + std::to_string(from) + " and stamp <=" + std::to_string(from + 3599);
    const double ours = BestSeconds(10, 3, [&] { (void)SyslogDBEpsGet(path, from, from + 3599); });
    const double rival = BestSeconds(10, 3, [&] {
        std::map<int32_t, SYSLOG_LOG_EPS> samples;
        readPlainly(path, sql.c_str(), [&samples](sqlite3_stmt* row) {
            const int32_t stamp = sqlite3_column_int(row, 1);
            SYSLOG_LOG_EPS& sample = samples[stamp];
            sample.stamp = stamp;
            sample.eps += static_cast<unsigned long long>(sqlite3_column_int(row, 3));
            sample.devices.emplace(text(row, 2), sqlite3_column_int(row, 3));
        });
    });
    Report("SyslogDBEpsGet, 1 hour (7,200 rows) of 30 days", ours, rival, "calls/s", 1);
}

void measureHistogram(std::string& path) {
    unsigned long long sum = 0;
    std::map<std::string, unsigned long long> counts;
    const auto addCount = [&sum](sqlite3_stmt* row) {
        sum += static_cast<unsigned long long>(sqlite3_column_int64(row, 0));
    };
    Report("SyslogDBHistGet, 10,000 devices", BestSeconds(10, 3, [&] { (void)SyslogDBHistGet(path, 0); }),
           BestSeconds(10, 3,
                       [&] {
                           counts.clear();
                           readPlainly(path, "SELECT * FROM histogram", [&counts](sqlite3_stmt* row) {
                               counts.emplace(text(row, 1),
                                              static_cast<unsigned long long>(sqlite3_column_int64(row, 2)));
                           });
                       }),
           "calls/s", 1);
    Report("SyslogDBHistTotalGet, 10,000 devices", BestSeconds(10, 20, [&] { sum += SyslogDBHistTotalGet(path); }),
           BestSeconds(10, 20, [&] { readPlainly(path, "SELECT SUM(count) FROM histogram", addCount); }), "calls/s", 1);
    Report("SyslogDBHistGetSingle, 10,000 devices",
           BestSeconds(10, 50, [&] { sum += SyslogDBHistGetSingle(path, "router07000.example.net"); }),
           BestSeconds(10, 50,
                       [&] {
                           readPlainly(path, "SELECT count FROM histogram WHERE device = 'router07000.example.net'",
                                       addCount);
                       }),
           "calls/s", 1);
}

}  // namespace

void MeasureStatistics() {
    std::string path = makeDatabase();
    measureSamples(path);
    measureHistogram(path);
    std::filesystem::remove(path);
}

}  // namespace quor::bench
