#include "logger/event_fixture.h"

namespace {

using quor::test::EventLog;
using quor::test::SqliteFile;
using quor::test::Strings;

TEST_F(EventLog, AddCreatesTheDatabaseAndStoresNumbersAsNumbers) {
    quor::test::SetClock(1700000000);
    EXPECT_EQ(logger_.LogAdd(path_, 2, "admin", "\"a\" \\ 100% caf\xC3\xA9\n--"), 0);
    EXPECT_EQ(logger_.LogAdd(path_, 0, "", ""), 0);
    EXPECT_EQ(stored(path_), Strings({"2 1700000000 admin \"a\" \\ 100% caf\xC3\xA9\n--", "0 1700000000  "}));
    EXPECT_EQ(SqliteFile(path_).query("SELECT typeof(level) || typeof(time) || id FROM log"),
              Strings({"integerinteger1", "integerinteger2"}));
    EXPECT_EQ(logger_.LogCount(path_), 2);
    EXPECT_EQ(logger_.LogAdd("/proc/none/events.db", 0, "u", "e"), -1);
    EXPECT_EQ(lastMessage(), "Fail to connect db");
}

TEST_F(EventLog, AddWithAnApostropheFailsWithoutATrace) {
    quor::test::SetClock(2147483648);  // one second after 32 bits
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
