// Damaged databases through every function that reads or writes one: it answers, and with no more than there was.
#include <random>

#include "dbhandler.h"
#include "dbutil.h"
#include "tests/support/testing.h"

namespace quor::test {
namespace {

constexpr size_t kPage = 1024;
constexpr int kRows = 300;

class Corrupt : public testing::Test {
  protected:
    // A database with every table that the library reads, half of its rows only in the write-ahead log.
    Corrupt() {
        SqliteFile db(folder_.path("whole.db"));
        db.run(
            "PRAGMA page_size=1024; PRAGMA journal_mode=WAL; PRAGMA wal_autocheckpoint=0;"
            "CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, host TEXT, utcsec INTEGER, prio TEXT, msg TEXT);"
            "CREATE INDEX logs_host ON logs(host);"
            "CREATE TABLE db_info(id INTEGER PRIMARY KEY, start_time, end_time, log_count, device);"
            "INSERT INTO db_info VALUES(1, 1, 2, 3, 'd');"
            "CREATE TABLE eps(id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);"
            "CREATE TABLE histogram(id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);"
            "INSERT INTO histogram VALUES(1, 'h', 5); INSERT INTO eps VALUES(1, 100, 'h', 2);");
        const std::string rows =
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 150) INSERT INTO logs(host, "
            "utcsec, prio, msg) SELECT 'h' || (i % 9), i, 'info', hex(zeroblob(i % 700)) FROM n;";
        db.run(rows + "PRAGMA wal_checkpoint(TRUNCATE);");
        db.run(rows);
        main_ = ReadFile(folder_.path("whole.db"));
        log_ = ReadFile(folder_.path("whole.db-wal"));
        index_ = ReadFile(folder_.path("whole.db-shm"));
    }

    // Everything that the library does with a database file; the sanitizers watch. The rows that it still had.
    int exercise(const std::string& main, const std::string& log, const std::string& index) {
        std::string path = folder_.write("damaged.db", main);
        folder_.write("damaged.db-wal", log);
        folder_.write("damaged.db-shm", index);
        std::list<_SYSLOG_SQL_COND_tag> found{{SYSLOG_ATTRI_HOST, 0, "h1", {}}};
        std::list<_SYSLOG_SQL_COND_tag> all;
        std::map<unsigned long long, std::string> names;
        std::list<std::string> values;
        std::string host = "host";
        int rows = 0;
        const auto take = [](_SYSLOG_LOG_DATA_tag&, void* seen) { return ++*static_cast<int*>(seen) > kRows ? 1 : 0; };
        const int whole = SyslogDBSelect(path, all, nullptr, nullptr, take, &rows, true);
        EXPECT_LE(rows, kRows);
        EXPECT_EQ(whole < 0 ? rows : 0, 0) << "a failed search hands over nothing";
        EXPECT_LE(SyslogDBSelectCount(path, found, nullptr, nullptr), kRows);
        (void)SyslogDBExtkeyMapGet(path, SYSLOG_EXTKEY_HOST, names);
        (void)SyslogDBAttriValueGet(path, host, nullptr, values);
        (void)SyslogDBHistTotalGet(path);
        (void)SyslogDBEpsGet(path, 0, 1000);
        (void)SyslogDBDelete(path, found);
        DBHandler handle(path, folder_.path("none.sql"));
        if (handle.DBCon() == 0) {
            (void)handle.DBLogCountGet();
            (void)handle.DBInfoStartGet();
            (void)handle.DBInfoEndSet(7);
            (void)handle.DBWalCheckpoint(false);
        }
        handle.DBDiscon();
        TakeSystemLog();
        return rows;
    }

    TempFolder folder_;
    std::string main_;
    std::string log_;
    std::string index_;
    std::mt19937 random_{7};
};

TEST_F(Corrupt, PagesAndCutFilesAreAnswered) {
    EXPECT_EQ(exercise(main_, log_, index_), kRows);
    EXPECT_EQ(exercise(main_, "", ""), kRows / 2);
    for (int round = 0; round < 60; ++round) {
        std::string main = main_;
        for (int left = round % 3 == 0 ? 1 : 10; left > 0; --left) {
            const size_t page = round % 5 == 0 && left == 1 ? 0 : random_() % (main_.size() / kPage);
            std::generate_n(main.begin() + static_cast<long>(page * kPage), kPage,
                            [&] { return round % 2 == 0 ? '\0' : static_cast<char>(random_()); });
        }
        exercise(main, round % 4 == 0 ? log_ : "", "");
    }
    for (size_t size = 0; size < main_.size(); size += kPage) {
        exercise(main_.substr(0, size), "", "");
    }
}

TEST_F(Corrupt, WriteAheadLogsThatAreCutSwappedOrStaleAreAnswered) {
    for (size_t size = 0; size <= log_.size(); size += log_.size() / 12) {
        exercise(main_, log_.substr(0, size), index_);
        exercise(main_, log_, index_.substr(0, size));
    }
    std::string other = log_;
    std::shuffle(other.begin() + 32, other.end(), random_);
    exercise(main_, other, "");
    exercise(main_.substr(0, 3 * kPage), log_, index_);
    exercise(log_, main_, index_);
}

}  // namespace
}  // namespace quor::test
