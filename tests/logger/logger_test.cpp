#include "logger.h"

#include "tests/support/clock.h"
#include "tests/support/database.h"
#include "tests/support/db_spy.h"

using namespace quor::test;

namespace {

// The schema where the library looks for it, and no event database of the package.
class EventLog : public DatabaseTest {
  protected:
    EventLog() {
        WriteFile(quor::paths::kEventSchema, ReadFile(SCHEMA_FOLDER "/quorsyslog.sql"));
        std::filesystem::remove_all(own_.substr(0, own_.rfind('/')));
        path_ = folder_.path("new folder/events.db");
        SpyOnDb() = {};
    }
    ~EventLog() override { ResetClock(); }

    // "level time user event" of each.
    static Strings stored(const std::string& path) {
        return SqliteFile(path).query(
            "SELECT level || ' ' || time || ' ' || user || ' ' || event FROM log ORDER BY id");
    }

    const std::string own_ = quor::paths::kEventDb;
    Logger logger_;
};

TEST_F(EventLog, EveryEventOfThePackageHasItsLevelAndText) {
    SetClock(5);
    int failures = logger_.LogAddServStart("%n a") + logger_.LogAddServStop("a") + logger_.LogAddNotifyEps(UINT64_MAX);
    failures += logger_.LogAddNotifySev("any", "c") + logger_.LogAddNotifySev(SYSLOG_PRIORITY_WARNING, "c");
    failures += logger_.LogAddNotifyKw("k", "c") + logger_.LogAddArchStart("d") + logger_.LogAddArchFinish("d");
    failures += logger_.LogAddArchFailed("d") + logger_.LogAddLogClear("/%s.db", "admin") + logger_.LogAddVolFull();
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(
        stored(own_),
        Strings({"0 5 SYSTEM Server was started [%n a].", "0 5 SYSTEM Server was stopped [a].",
                 "0 5 SYSTEM Event detection: EPS is larger than [18446744073709551615].",
                 "0 5 SYSTEM Event detection: Received log which severity is [any]. Log content: [c]",
                 "0 5 SYSTEM Event detection: Received log which severity is [warning]. Log content: [c]",
                 "0 5 SYSTEM Event detection: Received log which contains [k]. Log content: [c]",
                 "0 5 SYSTEM Log database [d] starts to archive.", "0 5 SYSTEM Log database [d] has been archived.",
                 "0 5 SYSTEM Log database [d] is failed to archived.", "0 5 SYSTEM /%s.db was cleared by admin",
                 "1 5 SYSTEM Volume space is not enough."}));
    EXPECT_EQ(logger_.LogAddNotifySev(SYSLOG_PRIORITY_ERR, "user 'root'"), -1);
    EXPECT_EQ(lastMessage(), "Fail to add log");
}

TEST(LevelName, IsCutToTheBufferAndEmptyWhenUnknown) {
    char buffer[8] = "?";
    EXPECT_EQ(szLevelGet(1, buffer, -1), 0);
    EXPECT_EQ(buffer[0], '?');
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_EQ(buffer + strLevelGet(-1) + strLevelGet(0) + strLevelGet(2) + strLevelGet(3), "WarInformationError");
    EXPECT_EQ(szLevelGet(1, nullptr, 4), -1);
}

TEST_F(EventLog, AddCreatesTheDatabaseAndFailsWithoutATraceOnAnApostrophe) {
    SetClock(7);
    EXPECT_EQ(logger_.LogAdd(path_, 2, "admin", "\"a\" \\ 100% caf\xC3\xA9\n--"), 0);
    EXPECT_EQ(stored(path_), Strings({"2 7 admin \"a\" \\ 100% caf\xC3\xA9\n--"}));
    SetClock(2147483648);  // one second after 32 bits
    EXPECT_EQ(logger_.LogAdd(path_, -1, "u", "it's"), -1);
    EXPECT_EQ(lastMessage(), "Fail to execute SQL command: INSERT INTO log VALUES(NULL,'18446744073709551615',"
                             "'18446744071562067968','u','it's');");
    EXPECT_EQ(logger_.LogAdd(path_, 0, "", ""), 0) << "the file is not locked";
    EXPECT_EQ(logger_.LogAdd("/proc/none/events.db", 0, "u", "e"), -1);
    EXPECT_EQ(lastMessage(), "Fail to connect db");
}

TEST_F(EventLog, CountNeverCreatesAndReportsWhatFails) {
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    const std::string missing = folder_.path("missing");
    // The database, what fails, the rows that can be fetched before that, and the message.
    const std::tuple<std::string, const char*, int, const char*> cases[] = {
        {"events.db", "", -1, "Invalid syslog db path!"},
        {"", "", -1, "Invalid syslog db path!"},
        {missing, "", -1, "Fail to connect syslog log database"},
        {path_, "COUNT", -1, "Fail to select syslog log database"},
        {path_, "", 0, "Fail to fetch row"},
    };
    for (const auto& [path, failing, rowsLeft, message] : cases) {
        SpyOnDb().failing = failing;
        SpyOnDb().rowsLeft = rowsLeft;
        EXPECT_EQ(logger_.LogCount(path), -1) << path;
        EXPECT_EQ(lastMessage(), message);
    }
    EXPECT_FALSE(std::filesystem::exists(missing));
}

TEST_F(EventLog, AddDoesNotNeedATransaction) {
    SpyOnDb().failing = "BEGIN;";
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(lastMessage(), "Fail to check sanity (DBTranEnd)");
    EXPECT_EQ(stored(path_).size(), 1U);
}

TEST_F(EventLog, RotationFrom20000EventsRemovesOnlyThoseWithoutATime) {
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    run("WITH RECURSIVE n(i) AS (SELECT 0 UNION ALL SELECT i + 1 FROM n WHERE i < 19996) "
        "INSERT INTO log SELECT NULL, 0, 1000 * i, 'u', hex(randomblob(40)) FROM n; "
        "CREATE TABLE junk AS SELECT randomblob(100000); DROP TABLE junk");
    for (const char* reason : {"too few to rotate", "the one without a time is gone"}) {
        ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
        EXPECT_EQ(logger_.LogCount(path_), 19999) << reason;
    }
    EXPECT_EQ(query("PRAGMA freelist_count"), Strings({"0"})) << "compacted";

    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    for (const std::string statement : {"SELECT time FROM log ORDER BY time DESC LIMIT 1 OFFSET 18000",
                                        "DELETE FROM log WHERE time <= 0", "VACUUM"}) {
        SpyOnDb().failing = statement;
        EXPECT_EQ(logger_.LogRotation(path_), -1);
        EXPECT_EQ(lastMessage(), "Fail to execute SQL command: " + statement);
    }
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "kept"), 0);
    EXPECT_EQ(lastMessage(), "Fail to rotate log database");
    SpyOnDb() = {};
    EXPECT_EQ(logger_.LogRotation(path_), 0);
}

TEST_F(EventLog, ListsNewestFirstAndBoundsNumbers) {
    logger_.LogAdd(path_, 0, "u", "e");
    run("UPDATE log SET time = 3; INSERT INTO log VALUES(NULL, 1, 0, 'u', 'e'), (NULL, 1, 1, 'u', 'e'), "
        "(NULL, 1, 2, 'u', 'e')");
    // The offset, the limit and the times; without a limit there is no offset; -1 is too large for one.
    using Case = std::tuple<int, int, std::vector<int64_t>>;
    for (const auto& [offset, limit, times] : {Case{2, 0, {3, 2, 1, 0}}, Case{1, 2, {2, 1}}, Case{-1, 5, {}}}) {
        std::vector<int64_t> listed;
        for (const _SSYSLOG_LOG_LOG_tag& event : logger_.LogEnum(path_, offset, limit)) {
            listed.push_back(event.time);
        }
        EXPECT_EQ(listed, times);
    }
    EXPECT_EQ(lastMessage(), "Fail to execute SQL command SELECT * FROM log ORDER BY time DESC LIMIT 5 OFFSET "
                             "18446744073709551615");
    EXPECT_TRUE(logger_.LogEnum("/proc/none/events.db", 0, 0).empty());
    EXPECT_EQ(lastMessage(), "Fail to connect db");
    run("DELETE FROM log; INSERT INTO log VALUES(4000000000, -9999999999, 9999999999, NULL, NULL)");
    const _SSYSLOG_LOG_LOG_tag event = logger_.LogEnum(path_, 0, 0).front();
    EXPECT_EQ(event.id, INT32_MAX);
    EXPECT_EQ(event.level, INT32_MIN);
    EXPECT_EQ(event.time, 9999999999);
    EXPECT_EQ(event.user + event.event, "");
}

TEST_F(EventLog, HtmlPageIsExactAndUnescaped) {
    setenv("TZ", "XXX-05:45", 1);
    tzset();
    logger_.LogAdd(path_, 0, "u", "e");
    run("DELETE FROM log; INSERT INTO log VALUES(1, 1, 4294967296 + 60, 'admin', '<b>&amp;'), (2, 7, 0, '', '')");
    const std::string page = folder_.write("page.html", std::string(5000, 'x'));  // replaced
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", page), 0);
    EXPECT_EQ(ReadFile(page), "<html><head>\n<meta http-equiv=\"Content-Type\" content=\"text/html; charset=utf-8;\">\n"
                              "<title>Syslog Server Log</title>\n</head>\n<body>\n"
                              "<center><h2> Syslog Server Log </h2></center>\n<table border=1 width=95%>\n<tr>\n"
                              "<th>Type</th><th>Time</th><th>User</th><th>Event</th></tr>\n"
                              "<tr>\n<td align=\"center\">Warning</td>\n<td align=\"center\">1970-01-01T05:46:00</td>"
                              "<td align=\"center\">admin</td><td align=\"left\"><b>&amp;</td></tr>\n"
                              "<tr>\n<td align=\"center\"></td>\n<td align=\"center\">1970-01-01T05:45:00</td>"
                              "<td align=\"center\"></td><td align=\"left\"></td></tr>\n"
                              "</table></body></html>\n");
    unsetenv("TZ");
    for (const int removed : {0, -1}) {
        EXPECT_EQ(logger_.LogHtmlRemove(page), removed);
    }
    EXPECT_EQ(logger_.LogHtmlRemove(""), -1);
    const std::tuple<std::string, const char*, std::string, int> cases[] = {
        {"", "x", page, -1},
        {path_, "", page, -1},
        {path_, "x", "", -1},
        {path_, "x", "/proc/none/page.html", 0},
        {"/proc/none/events.db", "x", page, 0},
    };
    for (const auto& [path, extra, out, result] : cases) {
        EXPECT_EQ(logger_.LogHtmlGen(path, extra, out), result) << path << " " << extra << " " << out;
    }
    EXPECT_FALSE(std::filesystem::exists(page)) << "no events, no page";
}

TEST_F(EventLog, ClearLeavesOnlyWhoDidIt) {
    ASSERT_EQ(logger_.LogAddVolFull(), 0);
    SqliteFile reader(own_);  // still open while the file goes
    ASSERT_EQ(reader.query("SELECT count(*) FROM log"), Strings({"1"}));
    SetClock(7);
    EXPECT_EQ(logger_.LogClear(own_, "admin"), 0);
    EXPECT_EQ(lastMessage().substr(0, 15), "create database");
    EXPECT_EQ(stored(own_), Strings({"0 7 SYSTEM " + own_ + " was cleared by admin"}));
    EXPECT_EQ(logger_.LogClear(own_, "o'brien"), 0);
    EXPECT_EQ(lastMessage(), "logger:54 Fail to add log [Log was cleared.]");
    EXPECT_EQ(logger_.LogCount(own_), 0);
}

}  // namespace
