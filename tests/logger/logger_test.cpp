#include "logger.h"

#include "tests/support/clock.h"
#include "tests/support/database.h"

using namespace quor::test;

namespace {

// The schema where the library looks for it, and no event database of the package.
class EventLog : public DatabaseTest {
  protected:
    EventLog() {
        WriteFile(quor::paths::kEventSchema, ReadFile(SCHEMA_FOLDER "/quorsyslog.sql"));
        std::filesystem::remove_all(own_.substr(0, own_.rfind('/')));
        path_ = folder_.path("new folder/events.db");
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
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_EQ(buffer + strLevelGet(0) + strLevelGet(2) + strLevelGet(3), "WarInformationError");
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

TEST_F(EventLog, CountNeverCreates) {
    for (const auto& [path, message] : {std::pair<std::string, const char*>{"events.db", "Invalid syslog db path!"},
                                        {folder_.path("missing"), "Fail to connect syslog log database"}}) {
        EXPECT_EQ(logger_.LogCount(path), -1) << path;
        EXPECT_EQ(lastMessage(), message);
    }
    EXPECT_FALSE(std::filesystem::exists(folder_.path("missing")));
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

    run("INSERT INTO log VALUES(NULL, 0, 0, '', ''); "
        "CREATE TRIGGER no BEFORE DELETE ON log BEGIN SELECT RAISE(ABORT, 'no'); END");
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "kept"), 0) << "although rotating fails";
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
    const std::string page = folder_.path("page.html");
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
    EXPECT_EQ(logger_.LogHtmlGen(path_, "", page), -1);
    EXPECT_EQ(logger_.LogHtmlGen("/proc/none/events.db", "x", page), 0);
    EXPECT_FALSE(std::filesystem::exists(page)) << "no events, no page";
}

TEST_F(EventLog, ClearLeavesOnlyWhoDidIt) {
    ASSERT_EQ(logger_.LogAddVolFull(), 0);
    SqliteFile reader(own_);  // still open while the file goes
    ASSERT_EQ(reader.query("SELECT count(*) FROM log"), Strings({"1"}));
    SetClock(7);
    EXPECT_EQ(logger_.LogClear(own_, "admin"), 0);
    EXPECT_EQ(stored(own_), Strings({"0 7 SYSTEM " + own_ + " was cleared by admin"}));
    EXPECT_EQ(logger_.LogClear(own_, "o'brien"), 0);
    EXPECT_EQ(logger_.LogCount(own_), 0);
}

}  // namespace
