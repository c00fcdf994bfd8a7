#include "dbhandler.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

class Metadata : public testing::Test {
  protected:
    Metadata() { TakeSystemLogTexts(); }
    ~Metadata() override { handle_.DBDiscon(); }

    const TempFolder folder_;
    const std::string schema_ = folder_.write(
        "schema.sql",
        "CREATE TABLE logs(utcsec INTEGER);"
        "CREATE TABLE db_info(id INTEGER, start_time INTEGER, end_time INTEGER, log_count INTEGER, device);"
        "INSERT INTO db_info VALUES(1, 0, 0, 0, NULL);");
    const std::string path_ = folder_.path("a b/c d/log.db");
    DBHandler handle_{path_, schema_};
};

TEST_F(Metadata, AMissingDatabaseIsCreatedFromTheSchema) {
    ASSERT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(SqliteFile(path_).query("PRAGMA journal_mode"), Strings({"wal"}));
    EXPECT_EQ(handle_.DBcheckTableExist("db_info"), 1);
    const std::string path = folder_.write("file", "") + "/log.db";
    EXPECT_EQ(DBHandler(path, schema_).DBCon(), -1);
    EXPECT_EQ(TakeSystemLogTexts(),
              Strings({"create database: " + path_ + " by " + schema_, "Fail to create folder: " + folder_.path("file"),
                       "Fail to create database: " + path}));
    EXPECT_EQ(DBHandler(folder_.path("log.db"), folder_.path("none.sql")).DBCreate(), 0) << "the shell ran";
}

TEST_F(Metadata, TheInfoRowIsReadAndWritten) {
    ASSERT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(handle_.DBInfoStartSet(1000), 0);
    EXPECT_EQ(handle_.DBInfoEndSet(5000000000), 0);
    EXPECT_EQ(handle_.DBInfoDevSet(handle_.DBCmdEscape("O'Neil")), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT typeof(start_time), end_time FROM db_info"),
              Strings({"integer", "5000000000"}));
    _ARCH_DB_INFO_tag info;
    ASSERT_EQ(handle_.DBInfoGet(info), 0);
    EXPECT_EQ(info.start_time, 1000);
    EXPECT_EQ(info.end_time, 2147483647) << "times are read as 32 bits, saturated";
    EXPECT_EQ(info.device, "O'Neil");

    EXPECT_EQ(handle_.DBInfoDevSet("O'Neil"), -1);
    EXPECT_EQ(handle_.DBInfoDevSet("x'; DELETE FROM db_info; --"), -1);
    EXPECT_EQ(TakeSystemLogTexts().back(), "Fail to execute SQL command: UPDATE db_info SET device='x'; DELETE FROM "
                                           "db_info; --' WHERE id=1");
    SqliteFile(path_).run("DROP TABLE db_info");
    EXPECT_EQ(handle_.DBInfoGet(info), -1);
    EXPECT_EQ(info.start_time, 1000) << "a failure left the record untouched";
}

TEST_F(Metadata, TimesComeFromTheLogs) {
    setenv("TZ", "UTC-3", 1);
    tzset();
    ASSERT_EQ(handle_.DBCon(), 0);
    TakeSystemLogTexts();
    EXPECT_EQ(handle_.DBInfoStartStrGet(), "1970-01-01");
    EXPECT_EQ(handle_.DBInfoEndStrGet(), "1970-01-01");
    EXPECT_EQ(TakeSystemLogTexts(), Strings({"Fail to get database start time", "Fail to get database end time"}));
    handle_.DBExecute("INSERT INTO logs VALUES(1767222000), (1767214800), (1767300000)");  // 23:00, 21:00 in UTC
    EXPECT_EQ(handle_.DBLogStartTimeGet(), 1767214800);
    EXPECT_EQ(handle_.DBInfoEndGet(), 1767300000);
    EXPECT_EQ(handle_.DBInfoStartStrGet(), "2026-01-01") << "a local date";
    TakeSystemLogTexts();
    handle_.DBExecute("DROP TABLE logs");
    EXPECT_EQ(handle_.DBLogStartTimeGet(), 0);
    for (const std::string& line : TakeSystemLogTexts()) {
        EXPECT_NE(line.rfind("Fail to execute SQL command: ", 0), 0U) << "not reported without the table";
    }
}

}  // namespace
