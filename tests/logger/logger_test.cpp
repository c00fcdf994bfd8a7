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
    const auto event = [&](int result) { return std::to_string(result) + " " + stored(own_).back(); };
    const std::string received = "0 0 5 SYSTEM Event detection: Received log which ";
    EXPECT_EQ(event(logger_.LogAddServStart("%n a")), "0 0 5 SYSTEM Server was started [%n a].");
    EXPECT_EQ(event(logger_.LogAddServStop("a")), "0 0 5 SYSTEM Server was stopped [a].");
    EXPECT_EQ(event(logger_.LogAddNotifyEps(UINT64_MAX)),
              "0 0 5 SYSTEM Event detection: EPS is larger than [18446744073709551615].");
    EXPECT_EQ(event(logger_.LogAddNotifySev("s", "c")), received + "severity is [s]. Log content: [c]");
    EXPECT_EQ(event(logger_.LogAddNotifySev(SYSLOG_PRIORITY_WARNING, "c")),
              received + "severity is [warning]. Log content: [c]");
    EXPECT_EQ(event(logger_.LogAddNotifyKw("k", "c")), received + "contains [k]. Log content: [c]");
    EXPECT_EQ(event(logger_.LogAddArchStart("d")), "0 0 5 SYSTEM Log database [d] starts to archive.");
    EXPECT_EQ(event(logger_.LogAddArchFinish("d")), "0 0 5 SYSTEM Log database [d] has been archived.");
    EXPECT_EQ(event(logger_.LogAddArchFailed("d")), "0 0 5 SYSTEM Log database [d] is failed to archived.");
    EXPECT_EQ(event(logger_.LogAddLogClear("/%s.db", "admin")), "0 0 5 SYSTEM /%s.db was cleared by admin");
    EXPECT_EQ(event(logger_.LogAddVolFull()), "0 1 5 SYSTEM Volume space is not enough.");
    EXPECT_EQ(Said(logger_.LogAddNotifySev(SYSLOG_PRIORITY_ERR, "user 'root'")), "-1 Fail to add log");
}

TEST(LevelName, IsCutToTheBufferAndEmptyWhenUnknown) {
    char buffer[8] = "?";
    EXPECT_EQ(szLevelGet(1, buffer, -1), 0);
    EXPECT_EQ(buffer[0], '?');
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_EQ(buffer + strLevelGet(-1) + strLevelGet(0) + strLevelGet(2) + strLevelGet(3), "WarInformationError");
    EXPECT_EQ(szLevelGet(1, nullptr, 4), -1);
}

TEST_F(EventLog, AddCreatesTheDatabaseAndReportsWhatFails) {
    SetClock(7);
    EXPECT_EQ(logger_.LogAdd(path_, 2, "admin", "\"a\" \\ 100% caf\xC3\xA9\n--"), 0);
    EXPECT_EQ(stored(path_), Strings({"2 7 admin \"a\" \\ 100% caf\xC3\xA9\n--"}));
    SetClock(2147483648);  // one second after 32 bits
    EXPECT_EQ(Said(logger_.LogAdd(path_, -1, "u", "it's")),
              "-1 Fail to execute SQL command: INSERT INTO log VALUES(NULL,'18446744073709551615',"
              "'18446744071562067968','u','it's');");
    EXPECT_EQ(Said(logger_.LogAdd("/proc/none/events.db", 0, "u", "e")), "-1 Fail to connect db");
    SpyOnDb().failing = "BEGIN;";
    EXPECT_EQ(Said(logger_.LogAdd(path_, 0, "", "")), "0 Fail to check sanity (DBTranEnd)") << "stored all the same";
    EXPECT_EQ(stored(path_).size(), 2U);
}

TEST_F(EventLog, CountNeverCreatesAndReportsWhatFails) {
    const std::string missing = folder_.path("missing");
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(Said(logger_.LogCount("")), "-1 Invalid syslog db path!");
    EXPECT_EQ(Said(logger_.LogCount("events.db")), "-1 Invalid syslog db path!");
    EXPECT_EQ(Said(logger_.LogCount(missing)), "-1 Fail to connect syslog log database");
    EXPECT_FALSE(std::filesystem::exists(missing));
    SpyOnDb().rowsLeft = 0;
    EXPECT_EQ(Said(logger_.LogCount(path_)), "-1 Fail to fetch row");
    SpyOnDb().failing = "SELECT COUNT(*) FROM log";
    EXPECT_EQ(Said(logger_.LogCount(path_)), "-1 Fail to select syslog log database");
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
        EXPECT_EQ(Said(logger_.LogRotation(path_)), "-1 Fail to execute SQL command: " + statement);
    }
    EXPECT_EQ(Said(logger_.LogAdd(path_, 0, "u", "kept")), "0 Fail to rotate log database");
    SpyOnDb() = {};
    EXPECT_EQ(logger_.LogRotation(path_), 0);
}

TEST_F(EventLog, ListsNewestFirstAndBoundsNumbers) {
    logger_.LogAdd(path_, 0, "u", "e");
    run("UPDATE log SET time = 3; INSERT INTO log VALUES(NULL, 1, 0, 'u', 'e'), (NULL, 1, 1, 'u', 'e'), "
        "(NULL, 1, 2, 'u', 'e')");
    const auto times = [&](const std::string& path, int offset, int limit) {
        std::string listed;
        for (const _SSYSLOG_LOG_LOG_tag& event : logger_.LogEnum(path, offset, limit)) {
            listed += std::to_string(event.time);
        }
        return Said(listed);
    };
    EXPECT_EQ(times(path_, 2, 0).substr(0, 5), "3210 ") << "without a limit there is no offset";
    EXPECT_EQ(times(path_, 1, 2), "21 ");
    EXPECT_EQ(times(path_, -1, 5),
              " Fail to execute SQL command SELECT * FROM log ORDER BY time DESC LIMIT 5 OFFSET 18446744073709551615");
    EXPECT_EQ(times("/proc/none/events.db", 0, 0), " Fail to connect db");
    run("DELETE FROM log; INSERT INTO log VALUES(4000000000, -9999999999, 9999999999, NULL, NULL)");
    const _SSYSLOG_LOG_LOG_tag event = logger_.LogEnum(path_, 0, 0).front();
    EXPECT_EQ(std::tie(event.id, event.level, event.time, event.user, event.event),
              std::make_tuple(INT32_MAX, INT32_MIN, 9999999999, "", ""));
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
    EXPECT_EQ(logger_.LogHtmlRemove(page), 0);
    EXPECT_EQ(logger_.LogHtmlRemove(page), -1);
    EXPECT_EQ(logger_.LogHtmlRemove(""), -1);
    EXPECT_EQ(logger_.LogHtmlGen("", "x", page), -1);
    EXPECT_EQ(logger_.LogHtmlGen(path_, "", page), -1);
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", ""), -1);
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", "/proc/none/page.html"), 0);
    EXPECT_EQ(logger_.LogHtmlGen("/proc/none/events.db", "x", page), 0);
    EXPECT_FALSE(std::filesystem::exists(page)) << "no events, no page";
}

TEST_F(EventLog, ClearLeavesOnlyWhoDidIt) {
    ASSERT_EQ(logger_.LogAddVolFull(), 0);
    SqliteFile reader(own_);  // still open while the file goes
    ASSERT_EQ(reader.query("SELECT count(*) FROM log"), Strings({"1"}));
    SetClock(7);
    EXPECT_EQ(Said(logger_.LogClear(own_, "admin")).substr(0, 17), "0 create database");
    EXPECT_EQ(stored(own_), Strings({"0 7 SYSTEM " + own_ + " was cleared by admin"}));
    EXPECT_EQ(Said(logger_.LogClear(own_, "o'brien")), "0 logger:54 Fail to add log [Log was cleared.]");
    EXPECT_EQ(logger_.LogCount(own_), 0);
}

}  // namespace
