#include "logger/event_fixture.h"

namespace {

using quor::test::EventLog;
using quor::test::SqliteFile;
using quor::test::Strings;

// `count` events, the last one without a time.
void fill(const std::string& path, int count) {
    SqliteFile(path).run("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < " +
                         std::to_string(count) +
                         ") INSERT INTO log SELECT NULL, 0, 1000 + i, 'u', hex(randomblob(40)) FROM n; "
                         "UPDATE log SET time = 0 WHERE id = (SELECT max(id) FROM log)");
}

TEST_F(EventLog, AddCreatesTheDatabaseAndStoresNumbersAsNumbers) {
    quor::test::SetClock(1700000000);
    EXPECT_EQ(logger_.LogAdd(path_, 2, "admin", "\"a\" \\ 100% caf\xC3\xA9\n--"), 0);
    EXPECT_EQ(logger_.LogAdd(path_, 0, "", ""), 0);
    EXPECT_EQ(stored(path_),
              Strings({"2", "1700000000", "admin", "\"a\" \\ 100% caf\xC3\xA9\n--", "0", "1700000000", "", ""}));
    EXPECT_EQ(SqliteFile(path_).query("SELECT DISTINCT typeof(level) || typeof(time) || id FROM log"),
              Strings({"integerinteger1", "integerinteger2"}));
    EXPECT_EQ(logger_.LogCount(path_), 2);
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

TEST_F(EventLog, AddFailsWhereNoFileCanBe) {
    EXPECT_EQ(logger_.LogAdd("/proc/none/events.db", 0, "u", "e"), -1);
    EXPECT_EQ(lastMessage(), "Fail to connect db");
}

TEST_F(EventLog, CountNeverCreates) {
    const struct {
        std::string path;
        const char* message;
    } cases[] = {
        {"", "Invalid syslog db path!"},
        {"events.db", "Invalid syslog db path!"},
        {folder_.path("missing.db"), "Fail to connect syslog log database"},
        {folder_.write("text", "this is no database, only a text that is long enough to be read as a header of one"),
         "Fail to select syslog log database"},
    };
    for (const auto& row : cases) {
        EXPECT_EQ(logger_.LogCount(row.path), -1) << row.path;
        EXPECT_EQ(lastMessage(), row.message);
    }
    EXPECT_FALSE(std::filesystem::exists(folder_.path("missing.db")));
}

TEST_F(EventLog, RotationFrom20000EventsRemovesOnlyThoseWithoutATime) {
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    fill(path_, 19997);
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(logger_.LogCount(path_), 19999) << "too few to rotate";
    SqliteFile(path_).run("CREATE TABLE junk AS SELECT randomblob(100000) AS b; DROP TABLE junk");
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    EXPECT_EQ(logger_.LogCount(path_), 19999) << "the one without a time is gone";
    EXPECT_EQ(SqliteFile(path_).query("PRAGMA freelist_count"), Strings({"0"})) << "compacted";
}

TEST_F(EventLog, FailedRotationKeepsTheEvent) {
    ASSERT_EQ(logger_.LogAdd(path_, 0, "u", "e"), 0);
    fill(path_, 20000);
    SqliteFile(path_).run("CREATE TRIGGER no BEFORE DELETE ON log BEGIN SELECT RAISE(ABORT, 'no'); END");
    EXPECT_EQ(logger_.LogAdd(path_, 0, "u", "kept"), 0);
    const Strings lines = quor::test::TakeSystemLogTexts();
    ASSERT_GE(lines.size(), 2U);
    EXPECT_EQ(lines[lines.size() - 2], "Fail to execute SQL command: DELETE FROM log WHERE time <= 0");
    EXPECT_EQ(lines.back(), "Fail to rotate log database");
    EXPECT_EQ(stored(path_).back(), "kept");
}

}  // namespace
