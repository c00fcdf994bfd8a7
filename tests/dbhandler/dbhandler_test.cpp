#include "dbhandler.h"

#include <syslog.h>

#include "quor/quordb.h"
#include "tests/support/database.h"
#include "tests/support/db_spy.h"
#include "tests/support/notices.h"
#include "tests/support/services.h"

using namespace quor::test;
namespace fs = std::filesystem;

namespace {

class Handle : public DatabaseTest {
  protected:
    Handle() {
        run("CREATE TABLE logs(utcsec); INSERT INTO logs VALUES(1), (2)");
        SpyOnDb() = {};
    }
    ~Handle() override { handle_.DBDiscon(); }

    std::string count() const { return query("SELECT count(*) FROM logs").front(); }

    DBHandler handle_{path_, ""};
};

int countRows(DBResult_tag* result, void* rows) {
    *static_cast<int*>(rows) = QUORDBNumRows(result);
    return -1;  // must not make the statement fail
}

TEST_F(Handle, WorksWhileItIsConnected) {
    EXPECT_EQ(handle_.DBExecute("DELETE FROM logs"), -1);
    expectLog({});  // only the callback form reports
    EXPECT_EQ(handle_.DBExecute("DELETE FROM logs", nullptr, nullptr), -1);
    EXPECT_EQ(handle_.DBLogCountGet(), ~0ULL);
    EXPECT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(handle_.DBCon(), -1);
    expectLog({"DB is not connected", "DB is not connected", "Connection is already existed"});
    int rows = 0;
    EXPECT_EQ(handle_.DBExecute("SELECT * FROM logs", countRows, &rows), 0);
    EXPECT_EQ(rows, 2);
    EXPECT_EQ(handle_.DBDiscon(), 0);
    EXPECT_FALSE(handle_.isConnected());
    EXPECT_EQ(handle_.DBDiscon(), 0);
    EXPECT_EQ(SpyOnDb().closed, 1) << "no connection is held, none is closed";
}

TEST_F(Handle, KeepsTheFlagOfATransaction) {
    // An operation, the statement that fails meanwhile; the flag, the rows that others see and the message then.
    using Step = std::tuple<int (DBHandler::*)(), const char*, int, const char*, const char*>;
    const auto start = &DBHandler::DBTranStart;
    const auto end = &DBHandler::DBTranEnd;
    const auto rollback = &DBHandler::DBTranRollback;
    handle_.DBCon();
    for (const auto& [operation, failing, flag, rows, message] : {
             Step{end, "", 0, "2", "Fail to check sanity (DBTranEnd)"},
             Step{start, "", 1, "2", ""},
             Step{start, "", 1, "2", "Fail to check sanity (DBTranStart)"},
             Step{rollback, "ROLLBACK;", 1, "2", "Fail to rollback transaction"},
             Step{end, "END;", 1, "2", "Fail to end transaction"},
             Step{rollback, "", 0, "2", ""},
             Step{start, "", 1, "2", ""},
         }) {
        SpyOnDb().failing = failing;
        const bool fails = *message != '\0';
        EXPECT_EQ((handle_.*operation)(), fails ? -1 : 0);
        EXPECT_EQ(handle_.isInTran(), flag);
        expectLog(fails ? Strings{message} : Strings{});
        if (flag == 1) {
            handle_.DBExecute("DELETE FROM logs");
        }
        EXPECT_EQ(count(), rows);
    }
    handle_.DBDiscon();
    EXPECT_EQ(handle_.isInTran(), 1) << "disconnecting changed the flag";
}

TEST_F(Handle, ChecksPointsTheLogAndRemovesItsFiles) {
    run("PRAGMA journal_mode=WAL");
    handle_.DBCon();
    handle_.DBExecute("DELETE FROM logs WHERE utcsec = 1");
    SpyOnDb().failing = "PRAGMA wal_checkpoint(FULL);";
    EXPECT_EQ(handle_.DBWalCheckpoint(true), -1);
    EXPECT_EQ(lastMessage(), "Fail to force WAL checkpoint(FULL)");
    SpyOnDb().failing = "";
    for (const bool remove : {false, true}) {
        EXPECT_TRUE(fs::exists(path_ + "-wal"));
        EXPECT_EQ(handle_.DBWalCheckpoint(remove), 0);
        EXPECT_NE(fs::exists(path_ + "-wal"), remove);
        EXPECT_NE(fs::exists(path_ + "-shm"), remove);
    }
}

class Metadata : public DatabaseTest {
  protected:
    Metadata() {
        FakeServices() = {};
        SpyOnDb() = {};
    }
    ~Metadata() override { handle_.DBDiscon(); }

    const std::string schema_ = folder_.write(
        "schema.sql", "CREATE TABLE logs(utcsec INTEGER); CREATE TABLE db_info(id, start_time INTEGER, end_time,"
                      " log_count, device); INSERT INTO db_info VALUES(1, 0, 0, '18446744073709551615', NULL);");
    const std::string new_ = folder_.path("a b/c d/log.db");
    DBHandler handle_{new_, schema_};
};

TEST_F(Metadata, AMissingDatabaseIsCreatedFromTheSchema) {
    ASSERT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(SqliteFile(new_).query("PRAGMA journal_mode"), Strings({"wal"}));
    EXPECT_EQ(handle_.DBcheckTableExist("db_info"), 1);
    EXPECT_EQ(handle_.DBcheckTableExist("nothing"), 0);
    EXPECT_EQ(handle_.DBInfoCntGet(), 0U);
    expectLog({"create database: " + new_ + " by " + schema_});
    const std::string shell = "/bin/sh -c /usr/bin/sqlite3 \"" + new_ + "\" ";
    EXPECT_EQ(FakeServices().commands, Strings({shell + "< " + schema_, shell + "\"PRAGMA journal_mode=WAL;\""}));
    EXPECT_EQ(FakeServices().folders, Strings({folder_.path("a b/c d") + " 0 1 -1 -1 511"}));
}

TEST_F(Metadata, AStepOfTheCreationThatFailsIsReported) {
    const std::string none = folder_.write("none.sql", "nonsense");
    const std::string wal = "/usr/bin/sqlite3 \"" + path_ + "\" \"PRAGMA journal_mode=WAL;\"";
    // The database, the command that fails, the result of connecting and the messages.
    const std::tuple<std::string, const char*, int, Strings> cases[] = {
        {"/proc/x/y.db", "", -1, {"Fail to create folder: /proc/x", "Fail to create database: /proc/x/y.db"}},
        {path_, "<", -1, {"Fail to create database: " + path_ + "," + none, "Fail to create database: " + path_}},
        {folder_.path(), "", -1, {"Fail to open db: " + folder_.path()}},
        {path_,
         "WAL",
         0,
         {"create database: " + path_ + " by " + none, "Fail to set jounal mode as WAL, use DELETE by default " + wal}},
    };
    for (const auto& [path, failing, result, messages] : cases) {
        FakeServices().failing = failing;
        DBHandler handle(path, none);
        EXPECT_EQ(handle.DBCon(), result) << path;
        expectLog(messages);
        handle.DBDiscon();
    }
}

TEST_F(Metadata, AStatementThatFailsIsReported) {
    ASSERT_EQ(handle_.DBCon(), 0);
    const std::tuple<std::string, long long, long long (*)(DBHandler&)> cases[] = {
        {"UPDATE db_info SET start_time='0' WHERE id=1", -1,
         [](auto& db) -> long long { return db.DBInfoStartSet(0); }},
        {"UPDATE db_info SET end_time='7' WHERE id=1", -1, [](auto& db) -> long long { return db.DBInfoEndSet(7); }},
        {"UPDATE db_info SET device='x'' WHERE id=1", -1, [](auto& db) -> long long { return db.DBInfoDevSet("x'"); }},
        {"SELECT * FROM logs ORDER BY utcsec ASC LIMIT 1", 0, [](auto& db) { return db.DBInfoStartGet(); }},
        {"SELECT * FROM logs ORDER BY utcsec DESC LIMIT 1", 0, [](auto& db) { return db.DBInfoEndGet(); }},
    };
    for (const auto& [statement, result, operation] : cases) {
        SpyOnDb().failing = statement;
        EXPECT_EQ(operation(handle_), result);
        EXPECT_EQ(lastMessage(), "Fail to execute SQL command: " + statement);
    }
    SpyOnDb().failing = "SELECT";
    _ARCH_DB_INFO_tag info;
    info.device = "kept";
    EXPECT_EQ(handle_.DBInfoGet(info), -1);
    EXPECT_EQ(lastMessage() + info.device, "Fail to execute SQL command: SELECT * FROM db_infokept");
    EXPECT_EQ(handle_.DBcheckTableExist("a'b"), 0);
    EXPECT_EQ(lastMessage(), "Fail to execute SQL command : SELECT count(*) as count_result FROM sqlite_master WHERE "
                             "type='table' AND name='a'b'");
    SpyOnDb().failing = "text";
    EXPECT_EQ(handle_.DBCmdEscape("x"), "");
    expectLog({"Fail to escapse string"});
}

TEST_F(Metadata, TheInfoRowIsReadAndWritten) {
    ASSERT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(handle_.DBInfoStartSet(1000), 0);
    EXPECT_EQ(handle_.DBInfoEndSet(18446744073709551615ULL), 0);
    EXPECT_EQ(handle_.DBInfoDevSet(handle_.DBCmdEscape("O'Neil")), 0);
    EXPECT_EQ(SqliteFile(new_).query("SELECT typeof(start_time), end_time FROM db_info"),
              Strings({"integer", "18446744073709551615"}));
    _ARCH_DB_INFO_tag info;
    ASSERT_EQ(handle_.DBInfoGet(info), 0);
    EXPECT_EQ(info.start_time, 1000);
    EXPECT_EQ(info.end_time, 2147483647) << "times are read as 32 bits, saturated";
    EXPECT_EQ(info.log_count, 18446744073709551615ULL);
    EXPECT_EQ(info.device, "O'Neil");
}

TEST_F(Metadata, TimesComeFromTheLogs) {
    setenv("TZ", "UTC-3", 1);
    tzset();
    ASSERT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(handle_.DBInfoStartStrGet(), "1970-01-01");
    EXPECT_EQ(lastMessage(), "Fail to get database start time");
    EXPECT_EQ(handle_.DBInfoEndStrGet(), "1970-01-01");
    EXPECT_EQ(lastMessage(), "Fail to get database end time");
    handle_.DBExecute("INSERT INTO logs VALUES(1767222000), (1767214800), (4294967296)");  // 23:00, 21:00 in UTC
    EXPECT_EQ(handle_.DBLogStartTimeGet(), 1767214800);
    EXPECT_EQ(handle_.DBInfoEndGet(), 2147483647) << "saturated too";
    EXPECT_EQ(handle_.DBInfoStartStrGet() + handle_.DBInfoEndStrGet(), "2026-01-012038-01-19") << "local dates";
}

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
    EXPECT_TRUE(fs::exists(path_));
}

TEST_F(Failure, OfACorruptDatabaseMovesItAsideAfterTheNotice) {
    run("CREATE TABLE logs(msg); INSERT INTO logs VALUES(zeroblob(100000))");
    overwrite(4096, std::string(80000, '\x77'));  // every page after the first
    folder_.write("log.db.corrupt", "older");
    bool stillThere = false;
    FakeNotices().onSend = [&] { stillThere = fs::exists(path_) && FakeServices().reloaded.empty(); };

    const auto lines = linesOf("SELECT sum(length(msg)) FROM logs WHERE msg LIKE 'x%'");
    EXPECT_TRUE(stillThere) << "the notice goes out first";
    EXPECT_EQ(FakeNotices().sent.at(0).tag, "QUORSYSLOG_DB_CORRUPT");
    EXPECT_EQ(FakeNotices().sent[0].values["%DBPATH%"], path_);
    EXPECT_EQ(FakeServices().reloaded, Strings({"service syslog-ng"}));
    EXPECT_FALSE(fs::exists(path_));
    EXPECT_GT(fs::file_size(path_ + ".corrupt"), 80000U);
    EXPECT_NE(lines.back().text.find("error code is : 11, "), std::string::npos) << lines.back().text;
}

TEST_F(Failure, OfOneStepOfTheRecoveryLeavesTheOthers) {
    FakeNotices().tablesFail = true;
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.write("log.db", "x")), -1);
    FakeNotices().tablesFail = false;
    EXPECT_TRUE(FakeNotices().sent.empty());
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.path("none.db")), -1);
    EXPECT_EQ(FakeNotices().sent.size(), 1U);
    EXPECT_TRUE(FakeServices().reloaded.empty());
    FakeServices().fail = true;
    FakeNotices().fail = true;
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, path_), -1);
    EXPECT_TRUE(fs::exists(path_ + ".corrupt"));
    EXPECT_EQ(lastMessage(), "dbhandler:88 Fail to send HUP signal to syslog-ng");
    FakeServices().fail = false;
    EXPECT_EQ(DBErrorHandle_SQLITE_CORRUPT(nullptr, folder_.write("log.db", "x")), 0);
}

class WorkingDb : public DatabaseTest {
  protected:
    WorkingDb() {
        WriteFile(marker_, "");
        FakeServices() = {};
    }
    ~WorkingDb() override { fs::remove(marker_); }

    const std::string marker_ = quor::paths::kPackageEnabled;
};

TEST_F(WorkingDb, HangsUpTheSyslogNgThatIsInCharge) {
    for (const std::string name : {"pkg-Orvane-syslog", "syslog-ng"}) {
        FakeServices() = {};
        EXPECT_EQ(SyslogngHupSignalSend(), 0);
        FakeServices().fail = true;
        EXPECT_EQ(SyslogngHupSignalSend(), -1);
        const std::string call = (name == "syslog-ng" ? "service " : "job ") + name;
        EXPECT_EQ(FakeServices().reloaded, Strings({call, call}));
        expectLog({"Fail to send HUP signal to " + name});
        fs::remove(marker_);
    }
}

TEST_F(WorkingDb, IsSwitchedToAWriteAheadLogByAShell) {
    EXPECT_EQ(SyslogngWorkingDbSetJouWal("/none/a b"), 0) << "the shell ran";
    EXPECT_EQ(FakeServices().commands, Strings({"/bin/sh -c /usr/bin/sqlite3 /none/a b \"PRAGMA journal_mode=WAL;\""}));
    FakeServices().failing = "sqlite3";
    EXPECT_EQ(SyslogngWorkingDbSetJouWal(path_), -1);
    expectLog({"Fail to set jounal mode as WAL, use DELETE by default"});
}

TEST_F(WorkingDb, IsRemovedAboveItsLimitInWholeKibibytes) {
    using Case = std::tuple<uintmax_t, int, bool>;
    for (const auto& [bytes, limitKB, kept] :
         {Case{3 * 1024ULL + 1023, 3, true}, Case{4 * 1024ULL, 3, false}, Case{0, -1, false},
          Case{(4ULL << 30U) + 1023, 4194304, true}, Case{5ULL << 40U, 2147483647, false}}) {
        SCOPED_TRACE(testing::Message() << bytes << " bytes, limit " << limitKB);
        FakeServices() = {};
        folder_.write("log.db", "");
        folder_.write("log.db-wal", "");
        fs::resize_file(path_, bytes);
        EXPECT_EQ(SyslogngWorkingDbCheck(path_, limitKB), 0);
        EXPECT_EQ(fs::exists(path_), kept);
        EXPECT_EQ(FakeServices().reloaded.size(), kept ? 0U : 1U);
        EXPECT_TRUE(fs::exists(path_ + "-wal"));
    }
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path("none.db"), 0), -1);
    EXPECT_EQ(SyslogngWorkingDbCheck(folder_.path(), 0), -1);
    expectLog({"Working database is not regular file"});
}

}  // namespace
