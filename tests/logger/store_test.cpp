#include "logger/event_fixture.h"

using namespace quor::test;

namespace {

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
    EXPECT_EQ(logger_.LogCount(own_), 11);
}

TEST(LevelName, IsCutToTheBufferAndEmptyWhenUnknown) {
    char buffer[8] = "?";
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_STREQ(buffer, "War");
    EXPECT_EQ(szLevelGet(1, nullptr, 4), -1);
    EXPECT_EQ(szLevelGet(0, buffer, -1), 0);
    EXPECT_EQ(buffer + strLevelGet(0) + strLevelGet(2) + strLevelGet(3) + strLevelGet(-1), "WarInformationError");
}

TEST_F(EventLog, AddCreatesTheDatabaseAndStoresNumbersAsNumbers) {
    SetClock(1700000000);
    EXPECT_EQ(logger_.LogAdd(path_, 2, "admin", "\"a\" \\ 100% caf\xC3\xA9\n--"), 0);
    EXPECT_EQ(logger_.LogAdd(path_, 0, "", ""), 0);
    EXPECT_EQ(stored(path_), Strings({"2 1700000000 admin \"a\" \\ 100% caf\xC3\xA9\n--", "0 1700000000  "}));
    EXPECT_EQ(SqliteFile(path_).query("SELECT DISTINCT typeof(level) || typeof(time) FROM log"),
              Strings({"integerinteger"}));
    EXPECT_EQ(logger_.LogAdd("/proc/none/events.db", 0, "u", "e"), -1);
    EXPECT_EQ(lastMessage(), "Fail to connect db");
}

TEST_F(EventLog, AddWithAnApostropheFailsWithoutATrace) {
    SetClock(2147483648);  // one second after 32 bits
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "first"), 0);
    EXPECT_EQ(logger_.LogAdd(path_, -1, "u", "it's"), -1);
    EXPECT_EQ(lastMessage(), "Fail to execute SQL command: INSERT INTO log VALUES(NULL,'18446744073709551615',"
                             "'18446744071562067968','u','it's');");
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "'); DELETE FROM log; --"), -1) << "a second statement";
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", std::string("a\0b", 3)), -1);
    EXPECT_EQ(logger_.LogCount(path_), 1);
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "the file is not locked"), 0);
}

TEST_F(EventLog, CountNeverCreates) {
    const std::string text = folder_.write("text", std::string(200, 'x'));
    for (const auto& [path, message] : {std::pair<std::string, const char*>{"", "Invalid syslog db path!"},
                                        {"events.db", "Invalid syslog db path!"},
                                        {folder_.path("missing"), "Fail to connect syslog log database"},
                                        {text, "Fail to select syslog log database"}}) {
        EXPECT_EQ(logger_.LogCount(path), -1) << path;
        EXPECT_EQ(lastMessage(), message);
    }
    EXPECT_FALSE(std::filesystem::exists(folder_.path("missing")));
}

TEST_F(EventLog, RotationFrom20000EventsRemovesOnlyThoseWithoutATime) {
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    SqliteFile(path_).run("WITH RECURSIVE n(i) AS (SELECT 0 UNION ALL SELECT i + 1 FROM n WHERE i < 19996) "
                          "INSERT INTO log SELECT NULL, 0, 1000 * i, 'u', hex(randomblob(40)) FROM n; "
                          "CREATE TABLE junk AS SELECT randomblob(100000); DROP TABLE junk");
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(logger_.LogCount(path_), 19999) << "too few to rotate";
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(logger_.LogCount(path_), 19999) << "the one without a time is gone";
    EXPECT_EQ(SqliteFile(path_).query("PRAGMA freelist_count"), Strings({"0"})) << "compacted";

    SqliteFile(path_).run("INSERT INTO log VALUES(NULL, 0, 0, '', ''); "
                          "CREATE TRIGGER no BEFORE DELETE ON log BEGIN SELECT RAISE(ABORT, 'no'); END");
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "kept"), 0);
    EXPECT_EQ(lastMessage(), "Fail to rotate log database");
    EXPECT_EQ(logger_.LogCount(path_), 20001);
}

}  // namespace
