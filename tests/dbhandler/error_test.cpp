#include <gtest/gtest.h>
#include <sqlite3.h>
#include <syslog.h>

#include "dbhandler.h"
#include "support/notices.h"
#include "support/services.h"
#include "support/sqlite_file.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

using quor::test::FakeNotices;
using quor::test::FakeServices;
using quor::test::SqliteFile;
using quor::test::TakeSystemLog;
using Strings = std::vector<std::string>;

class Failure : public testing::Test {
  protected:
    Failure() {
        FakeNotices() = {};
        FakeServices() = {};
        TakeSystemLog();
    }

    // The lines that a statement leaves in the system log of a database that others may hold open.
    std::vector<quor::test::SystemLogLine> linesOf(const std::string& sql) {
        DBHandler handle(path_, "");
        EXPECT_EQ(handle.DBCon(), 0);
        TakeSystemLog();
        EXPECT_EQ(handle.DBExecute(sql), -1);
        handle.DBDiscon();
        return TakeSystemLog();
    }

    // Fills every page after the first with garbage.
    void corrupt() const {
        SqliteFile(path_).run("CREATE TABLE logs(msg); INSERT INTO logs VALUES(zeroblob(100000))");
        std::fstream file(path_, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(4096);
        file << std::string(80000, '\x77');
    }

    const quor::test::TempFolder folder_;
    const std::string path_ = folder_.path("log.db");
};

}  // namespace

TEST_F(Failure, OfASyntaxErrorIsAnErrorOnlyWithoutTableLogs) {
    SqliteFile(path_).run("CREATE TABLE other(x)");
    auto lines = linesOf("SELEC 1");
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_ERR);
    EXPECT_EQ(lines[0].text, "dbhandler:125 Fail to execute SQL command: SELEC 1, error code is : 1, error cause: near "
                             "\"SELEC\": syntax error");

    SqliteFile(path_).run("CREATE TABLE logs(x)");
    lines = linesOf("SELECT 1; DROP TABLE logs");
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_INFO);
    EXPECT_NE(lines[0].text.find("error code is : 1, "), std::string::npos) << lines[0].text;
}

TEST_F(Failure, OfTheTableCheckItselfEnds) {
    SqliteFile(path_).run("CREATE TABLE logs(x)");
    std::fstream file(path_, std::ios::in | std::ios::out | std::ios::binary);
    file.seekp(47);
    file.put(9);  // a schema format of the future: every statement fails with code 1
    file.close();
    const auto lines = linesOf("SELECT 1 FROM logs");
    ASSERT_EQ(lines.size(), 3U);
    EXPECT_NE(lines[2].text.find("SELECT 1 FROM logs"), std::string::npos);
    EXPECT_EQ(lines[2].priority, LOG_ERR);
}

TEST_F(Failure, OfALockedDatabaseIsInformation) {
    SqliteFile(path_).run("CREATE TABLE logs(x)");
    SqliteFile other(path_);
    other.run("BEGIN EXCLUSIVE");
    const auto lines = linesOf("INSERT INTO logs VALUES(1)");
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_INFO);
    EXPECT_NE(lines[0].text.find("error code is : 5, error cause: database is locked"), std::string::npos);
}

TEST_F(Failure, OfAFileThatIsNoDatabaseIsInformation) {
    folder_.write("log.db", std::string(8192, 'x'));
    const auto lines = linesOf("SELECT 1 FROM logs");
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_INFO);
    EXPECT_TRUE(FakeNotices().sent.empty());
    EXPECT_TRUE(std::filesystem::exists(path_));
}

TEST_F(Failure, OfAConstraintIsAnError) {
    SqliteFile(path_).run("CREATE TABLE logs(x UNIQUE); INSERT INTO logs VALUES(1)");
    const auto lines = linesOf("INSERT INTO logs VALUES(1)");
    ASSERT_EQ(lines.size(), 1U);
    EXPECT_EQ(lines[0].priority, LOG_ERR);
}

TEST_F(Failure, OfACorruptDatabaseMovesItAsideAfterTheNotice) {
    corrupt();
    folder_.write("log.db.corrupt", "older");
    bool stillThere = false;
    FakeNotices().onSend = [&] { stillThere = std::filesystem::exists(path_) && FakeServices().reloaded.empty(); };

    const auto lines = linesOf("SELECT sum(length(msg)) FROM logs WHERE msg LIKE 'x%'");
    EXPECT_TRUE(stillThere) << "the notice goes out first";
    ASSERT_EQ(FakeNotices().sent.size(), 1U);
    EXPECT_EQ(FakeNotices().sent[0].tag, "QUORSYSLOG_DB_CORRUPT");
    EXPECT_EQ(FakeNotices().sent[0].values["%DBPATH%"], path_);
    EXPECT_EQ(FakeServices().reloaded, Strings({"service syslog-ng"}));
    EXPECT_FALSE(std::filesystem::exists(path_));
    EXPECT_GT(std::filesystem::file_size(path_ + ".corrupt"), 80000U);
    ASSERT_FALSE(lines.empty());
    EXPECT_EQ(lines.back().priority, LOG_ERR);
    EXPECT_NE(lines.back().text.find("error code is : 11, "), std::string::npos) << lines.back().text;
}

TEST_F(Failure, ToMoveTheFileStillSendsTheNotice) {
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.path("none.db")), -1);
    EXPECT_EQ(FakeNotices().sent.size(), 1U);
    EXPECT_TRUE(FakeServices().reloaded.empty());
}

TEST_F(Failure, ToReloadIsReported) {
    FakeServices().fail = true;
    FakeNotices().fail = true;
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.write("log.db", "x")), -1);
    EXPECT_TRUE(std::filesystem::exists(path_ + ".corrupt"));
    EXPECT_EQ(TakeSystemLog().back().text, "dbhandler:88 Fail to send HUP signal to syslog-ng");
}
