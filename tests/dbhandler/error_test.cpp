#include <syslog.h>

#include "dbhandler.h"
#include "support/database.h"
#include "support/notices.h"
#include "support/services.h"

using namespace quor::test;

namespace {

class Failure : public DatabaseTest {
  protected:
    Failure() {
        FakeNotices() = {};
        FakeServices() = {};
    }

    // The lines that a statement leaves in the system log of a database that others may hold open.
    std::vector<SystemLogLine> linesOf(const std::string& sql) {
        DBHandler handle(path_, "");
        EXPECT_EQ(handle.DBCon(), 0);
        TakeSystemLog();
        EXPECT_EQ(handle.DBExecute(sql), -1);
        handle.DBDiscon();
        return TakeSystemLog();
    }

    // So many, the last one with that priority and part of its text.
    void expectLines(const std::string& sql, size_t count, int priority, const char* text) {
        const auto lines = linesOf(sql);
        ASSERT_EQ(lines.size(), count);
        EXPECT_EQ(lines.back().priority, priority) << lines.back().text;
        EXPECT_NE(lines.back().text.find(text), std::string::npos) << lines.back().text;
    }

    void overwrite(std::streamoff at, const std::string& bytes) const {
        std::fstream file(path_, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(at);
        file << bytes;
    }
};

TEST_F(Failure, IsAnErrorOrInformation) {
    run("CREATE TABLE other(x)");
    expectLines("SELEC 1", 1, LOG_ERR,
                "dbhandler:125 Fail to execute SQL command: SELEC 1, error code is : 1, error cause: near \"SELEC\": "
                "syntax error");
    run("CREATE TABLE logs(x UNIQUE); INSERT INTO logs VALUES(1)");
    expectLines("SELECT 1; DROP TABLE logs", 1, LOG_INFO, "error code is : 1, ");
    expectLines("INSERT INTO logs VALUES(1)", 1, LOG_ERR, "error code is : 19, ");
    {
        SqliteFile other(path_);
        other.run("BEGIN EXCLUSIVE");
        expectLines("INSERT INTO logs VALUES(2)", 1, LOG_INFO, "error code is : 5, error cause: database is locked");
    }
    overwrite(47, "\x09");  // a schema format of the future: every statement fails with code 1, the table check too
    expectLines("SELECT 1 FROM logs", 3, LOG_ERR, "SELECT 1 FROM logs");
    folder_.write("log.db", std::string(8192, 'x'));
    expectLines("SELECT 1 FROM logs", 1, LOG_INFO, "error code is : 26, ");
    EXPECT_TRUE(FakeNotices().sent.empty());
    EXPECT_TRUE(std::filesystem::exists(path_));
}

TEST_F(Failure, OfACorruptDatabaseMovesItAsideAfterTheNotice) {
    run("CREATE TABLE logs(msg); INSERT INTO logs VALUES(zeroblob(100000))");
    overwrite(4096, std::string(80000, '\x77'));  // every page after the first
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

TEST_F(Failure, OfOneStepOfTheRecoveryLeavesTheOthers) {
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.path("none.db")), -1);
    EXPECT_EQ(FakeNotices().sent.size(), 1U);
    EXPECT_TRUE(FakeServices().reloaded.empty());
    FakeServices().fail = true;
    FakeNotices().fail = true;
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.write("log.db", "x")), -1);
    EXPECT_TRUE(std::filesystem::exists(path_ + ".corrupt"));
    EXPECT_EQ(lastMessage(), "dbhandler:88 Fail to send HUP signal to syslog-ng");
}

}  // namespace
