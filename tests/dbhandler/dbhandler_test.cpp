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
        FakeNotices() = {};
        FakeServices() = {};
        SpyOnDb() = {};
    }
    ~Handle() override { handle_.DBDiscon(); }

    // Creates the database, with two logs.
    void connect() {
        ASSERT_EQ(handle_.DBCon(), 0);
        ASSERT_EQ(Said(handle_.DBExecute("INSERT INTO logs VALUES(1), (2)")), "0 " + created_);
    }
    void overwrite(std::streamoff at, const std::string& bytes) const {
        std::fstream file(path_, std::ios::in | std::ios::out | std::ios::binary);
        file.seekp(at);
        file << bytes;
    }

    const std::string schema_ = folder_.write(
        "schema.sql", "CREATE TABLE logs(utcsec INTEGER); CREATE TABLE db_info(id, start_time INTEGER, end_time,"
                      " log_count, device); INSERT INTO db_info VALUES(1, 0, 0, '18446744073709551615', NULL);");
    const std::string created_ = "create database: " + path_ + " by " + schema_;
    DBHandler handle_{path_, schema_};
};

int countRows(DBResult_tag* result, void* rows) {
    *static_cast<int*>(rows) = QUORDBNumRows(result);
    return -1;  // must not make the statement fail
}

TEST_F(Handle, WorksWhileItIsConnected) {
    EXPECT_EQ(Said(handle_.DBExecute("DELETE FROM logs")), "-1 ") << "only the callback form reports";
    EXPECT_EQ(Said(handle_.DBExecute("DELETE FROM logs", nullptr, nullptr)), "-1 DB is not connected");
    EXPECT_EQ(handle_.DBLogCountGet(), ~0ULL);
    connect();
    EXPECT_EQ(Said(handle_.DBCon()), "-1 Connection is already existed");
    int rows = 0;
    EXPECT_EQ(handle_.DBExecute("SELECT * FROM logs", countRows, &rows), 0);
    EXPECT_EQ(rows, 2);
    EXPECT_EQ(handle_.DBInfoCntGet(), 2U);
    EXPECT_EQ(handle_.DBcheckTableExist("logs"), 1);
    EXPECT_EQ(handle_.DBcheckTableExist("log"), 0);
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(handle_.DBDiscon(), 0);
        EXPECT_FALSE(handle_.isConnected());
        EXPECT_EQ(SpyOnDb().closed, 1) << "no connection is held, none is closed";
    }
}

TEST_F(Handle, KeepsTheFlagOfATransaction) {
    connect();
    // The result and the message of an operation while a statement fails; the flag and the rows that others see then.
    const auto step = [&](int (DBHandler::*operation)(), const char* failing = "") {
        SpyOnDb().failing = failing;
        std::string outcome = Said((handle_.*operation)());
        outcome += ", " + std::to_string(handle_.isInTran());
        if (handle_.isInTran() == 1) {
            handle_.DBExecute("DELETE FROM logs");
        }
        return outcome + " " + query("SELECT count(*) FROM logs").front();
    };
    EXPECT_EQ(step(&DBHandler::DBTranEnd), "-1 Fail to check sanity (DBTranEnd), 0 2");
    EXPECT_EQ(step(&DBHandler::DBTranStart, "BEGIN;"), "-1 Fail to begin transaction, 0 2");
    EXPECT_EQ(step(&DBHandler::DBTranStart), "0 , 1 2");
    EXPECT_EQ(step(&DBHandler::DBTranStart), "-1 Fail to check sanity (DBTranStart), 1 2");
    EXPECT_EQ(step(&DBHandler::DBTranRollback, "ROLLBACK;"), "-1 Fail to rollback transaction, 1 2");
    EXPECT_EQ(step(&DBHandler::DBTranEnd, "END;"), "-1 Fail to end transaction, 1 2");
    EXPECT_EQ(step(&DBHandler::DBTranRollback), "0 , 0 2");
    EXPECT_EQ(step(&DBHandler::DBTranRollback), "-1 Fail to check sanity (DBTranRollback), 0 2");
    EXPECT_EQ(step(&DBHandler::DBTranStart), "0 , 1 2");
    EXPECT_EQ(step(&DBHandler::DBTranEnd), "0 , 0 0");
    handle_.DBTranStart();
    handle_.DBDiscon();
    EXPECT_EQ(handle_.isInTran(), 1) << "disconnecting changed the flag";
}

TEST_F(Handle, ChecksPointsTheLogAndRemovesItsFiles) {
    connect();
    SpyOnDb().failing = "PRAGMA wal_checkpoint(FULL);";
    EXPECT_EQ(Said(handle_.DBWalCheckpoint(true)), "-1 Fail to force WAL checkpoint(FULL)");
    SpyOnDb().failing = "";
    for (const bool remove : {false, true}) {
        EXPECT_TRUE(fs::exists(path_ + "-wal") && fs::exists(path_ + "-shm"));
        EXPECT_EQ(handle_.DBWalCheckpoint(remove), 0);
    }
    EXPECT_FALSE(fs::exists(path_ + "-wal") || fs::exists(path_ + "-shm"));
}

TEST_F(Handle, CreatesAMissingDatabaseAndReportsTheStepThatFails) {
    const std::string nested = folder_.path("a b/c d/log.db");
    const std::string shell = "/usr/bin/sqlite3 \"" + nested + "\" ";
    const std::string wal = shell + "\"PRAGMA journal_mode=WAL;\"";
    EXPECT_EQ(DBHandler(nested, schema_).DBCreate(), 0);
    EXPECT_EQ(FakeServices().commands, Strings({"/bin/sh -c " + shell + "< " + schema_, "/bin/sh -c " + wal}));
    EXPECT_EQ(SqliteFile(nested).query("PRAGMA journal_mode"), Strings({"wal"}));
    TakeSystemLog();

    const auto create = [&](const std::string& path, const char* failing) {
        FakeServices().failing = failing;
        return Said(DBHandler(path, schema_).DBCreate());
    };
    EXPECT_EQ(create("/proc/x/y.db", ""), "-1 Fail to create folder: /proc/x");
    EXPECT_EQ(create(nested, "<"), "-1 Fail to create database: " + nested + "," + schema_);
    EXPECT_EQ(create(nested, "WAL"), "0 Fail to set jounal mode as WAL, use DELETE by default " + wal);
    EXPECT_EQ(Said(DBHandler("/proc/x/y.db", "").DBCon()), "-1 Fail to create database: /proc/x/y.db");
    EXPECT_EQ(Said(DBHandler(folder_.path(), "").DBCon()), "-1 Fail to open db: " + folder_.path());
}

TEST_F(Handle, ReportsAStatementThatFails) {
    connect();
    const std::string failed = " Fail to execute SQL command: ";
    const std::string update = "-1" + failed + "UPDATE db_info SET ";
    const std::string read = "0" + failed + "SELECT * FROM logs ORDER BY utcsec ";
    EXPECT_EQ(Said(handle_.DBInfoDevSet("x'; DELETE FROM db_info; --")),
              update + "device='x'; DELETE FROM db_info; --' WHERE id=1");
    SpyOnDb().failing = "UPDATE";
    EXPECT_EQ(Said(handle_.DBInfoStartSet(0)), update + "start_time='0' WHERE id=1");
    EXPECT_EQ(Said(handle_.DBInfoEndSet(7)), update + "end_time='7' WHERE id=1");
    SpyOnDb().failing = " logs";
    EXPECT_EQ(Said(handle_.DBInfoStartGet()), read + "ASC LIMIT 1");
    EXPECT_EQ(Said(handle_.DBInfoEndGet()), read + "DESC LIMIT 1");
    SpyOnDb().failing = "SELECT";
    _ARCH_DB_INFO_tag info;
    info.device = "kept";
    EXPECT_EQ(Said(handle_.DBInfoGet(info)), "-1" + failed + "SELECT * FROM db_info");
    EXPECT_EQ(info.device, "kept");
    EXPECT_EQ(Said(handle_.DBcheckTableExist("a'b")),
              "0 Fail to execute SQL command : SELECT count(*) as count_result FROM sqlite_master WHERE type='table' "
              "AND name='a'b'");
}

TEST_F(Handle, ReadsAndWritesTheInfoRow) {
    connect();
    EXPECT_EQ(handle_.DBInfoStartSet(1000), 0);
    EXPECT_EQ(handle_.DBInfoEndSet(18446744073709551615ULL), 0);
    EXPECT_EQ(handle_.DBInfoDevSet(handle_.DBCmdEscape("O'Neil")), 0);
    EXPECT_EQ(query("SELECT typeof(start_time), end_time FROM db_info"), Strings({"integer", "18446744073709551615"}));
    _ARCH_DB_INFO_tag info;
    ASSERT_EQ(handle_.DBInfoGet(info), 0);
    EXPECT_EQ(std::tie(info.start_time, info.end_time, info.log_count, info.device),
              std::make_tuple(1000, 2147483647, 18446744073709551615ULL, "O'Neil"))
        << "times are read as 32 bits, saturated";
}

TEST_F(Handle, ReadsTimesFromTheLogs) {
    setenv("TZ", "UTC-3", 1);
    tzset();
    connect();
    handle_.DBExecute("DELETE FROM logs");
    EXPECT_EQ(Said(handle_.DBInfoStartStrGet()), "1970-01-01 Fail to get database start time");
    EXPECT_EQ(Said(handle_.DBInfoEndStrGet()), "1970-01-01 Fail to get database end time");
    handle_.DBExecute("INSERT INTO logs VALUES(1767222000), (1767214800), (4294967296)");  // 23:00, 21:00 in UTC
    EXPECT_EQ(handle_.DBLogStartTimeGet(), 1767214800);
    EXPECT_EQ(handle_.DBInfoEndGet(), 2147483647) << "saturated too";
    EXPECT_EQ(handle_.DBInfoStartStrGet() + handle_.DBInfoEndStrGet(), "2026-01-012038-01-19") << "local dates";
}

class Failure : public Handle {
  protected:
    // The priority and the text of the last line that a statement leaves, without what is the same in all; and how many
    // lines there were.
    std::string fail(const std::string& sql) {
        DBHandler handle(path_, "");
        EXPECT_EQ(handle.DBCon(), 0);
        TakeSystemLog();
        EXPECT_EQ(handle.DBExecute(sql), -1);
        handle.DBDiscon();
        const auto lines = TakeSystemLog();
        const std::string start = "dbhandler:125 Fail to execute SQL command: " + sql + ", error code is : ";
        EXPECT_EQ(lines.back().text.substr(0, start.size()), start);
        return std::to_string(lines.size()) + (lines.back().priority == LOG_ERR ? " error " : " information ") +
               lines.back().text.substr(start.size());
    }
};

TEST_F(Failure, IsAnErrorOrInformation) {
    run("CREATE TABLE other(x)");
    EXPECT_EQ(fail("SELEC 1"), "1 error 1, error cause: near \"SELEC\": syntax error");
    run("CREATE TABLE logs(x UNIQUE); INSERT INTO logs VALUES(1)");
    EXPECT_EQ(fail("SELEC 1"), "1 information 1, error cause: near \"SELEC\": syntax error");
    EXPECT_EQ(fail("INSERT INTO logs VALUES(1)"), "1 error 19, error cause: UNIQUE constraint failed: logs.x");
    {
        SqliteFile other(path_);
        other.run("BEGIN EXCLUSIVE");
        EXPECT_EQ(fail("DELETE FROM logs"), "1 information 5, error cause: database is locked");
    }
    overwrite(47, "\x09");  // a schema format of the future: every statement fails with code 1, the table check too
    EXPECT_EQ(fail("SELECT 1 FROM logs"), "3 error 1, error cause: unsupported file format");
    folder_.write("log.db", std::string(8192, 'x'));
    EXPECT_EQ(fail("SELECT 1 FROM logs"), "1 information 26, error cause: file is not a database");
    EXPECT_TRUE(FakeNotices().sent.empty());
    EXPECT_TRUE(fs::exists(path_));
}

TEST_F(Failure, OfACorruptDatabaseMovesItAsideAfterTheNotice) {
    run("CREATE TABLE logs(msg); INSERT INTO logs VALUES(zeroblob(100000))");
    overwrite(4096, std::string(80000, '\x77'));  // every page after the first
    folder_.write("log.db.corrupt", "older");
    bool stillThere = false;
    FakeNotices().onSend = [&] { stillThere = fs::exists(path_) && FakeServices().reloaded.empty(); };
    EXPECT_NE(fail("SELECT sum(length(msg)) FROM logs WHERE msg LIKE 'x%'").find(" error 11, "), std::string::npos);
    EXPECT_TRUE(stillThere) << "the notice goes out first";
    EXPECT_EQ(FakeNotices().sent.at(0).tag, "QUORSYSLOG_DB_CORRUPT");
    EXPECT_EQ(FakeNotices().sent[0].values["%DBPATH%"], path_);
    EXPECT_EQ(FakeServices().reloaded, Strings({"service syslog-ng"}));
    EXPECT_FALSE(fs::exists(path_));
    EXPECT_GT(fs::file_size(path_ + ".corrupt"), 80000U);
}

TEST_F(Failure, OfOneStepOfTheRecoveryLeavesTheOthers) {
    fs::remove(quor::paths::kNotifyRules);
    const auto recover = [&] { return Said(DBErrorHandle_SQLITE_CORRUPT(nullptr, path_)); };
    FakeServices().fail = true;
    EXPECT_EQ(recover(), "-1 Fail to load configuration") << "there is no file to move";
    EXPECT_EQ(FakeNotices().sent.size(), 1U);
    folder_.write("log.db", "x");
    FakeNotices().fail = true;
    EXPECT_EQ(recover(), "-1 dbhandler:88 Fail to send HUP signal to syslog-ng");
    EXPECT_TRUE(fs::exists(path_ + ".corrupt"));
    folder_.write("log.db", "x");
    FakeServices().fail = false;
    EXPECT_EQ(recover(), "0 Fail to send notification: QUORSYSLOG_DB_CORRUPT");
}

using WorkingDb = Handle;

TEST_F(WorkingDb, HangsUpTheSyslogNgThatIsInCharge) {
    WriteFile(quor::paths::kPackageEnabled, "");
    for (const std::string name : {"pkg-Orvane-syslog", "syslog-ng"}) {
        FakeServices() = {};
        EXPECT_EQ(Said(SyslogngHupSignalSend()), "0 ");
        FakeServices().fail = true;
        EXPECT_EQ(Said(SyslogngHupSignalSend()), "-1 Fail to send HUP signal to " + name);
        const std::string call = (name == "syslog-ng" ? "service " : "job ") + name;
        EXPECT_EQ(FakeServices().reloaded, Strings({call, call}));
        fs::remove(quor::paths::kPackageEnabled);
    }
}

TEST_F(WorkingDb, IsSwitchedToAWriteAheadLogByAShell) {
    EXPECT_EQ(SyslogngWorkingDbSetJouWal("/none/a b"), 0) << "the shell ran";
    EXPECT_EQ(FakeServices().commands, Strings({"/bin/sh -c /usr/bin/sqlite3 /none/a b \"PRAGMA journal_mode=WAL;\""}));
    FakeServices().failing = "sqlite3";
    EXPECT_EQ(Said(SyslogngWorkingDbSetJouWal(path_)), "-1 Fail to set jounal mode as WAL, use DELETE by default");
}

TEST_F(WorkingDb, IsRemovedAboveItsLimitInWholeKibibytes) {
    using Case = std::tuple<uintmax_t, int, bool>;
    folder_.write("log.db-wal", "");
    for (const auto& [bytes, limitKB, kept] :
         {Case{3 * 1024ULL + 1023, 3, true}, Case{4 * 1024ULL, 3, false}, Case{0, -1, false},
          Case{(4ULL << 30U) + 1023, 4194304, true}, Case{5ULL << 40U, 2147483647, false}}) {
        FakeServices() = {};
        folder_.write("log.db", "");
        fs::resize_file(path_, bytes);
        EXPECT_EQ(Said(SyslogngWorkingDbCheck(path_, limitKB)), "0 ");
        EXPECT_EQ(fs::exists(path_), kept) << bytes << " bytes, limit " << limitKB;
        EXPECT_EQ(FakeServices().reloaded.size(), kept ? 0U : 1U);
        EXPECT_TRUE(fs::exists(path_ + "-wal"));
    }
    EXPECT_EQ(Said(SyslogngWorkingDbCheck(folder_.path("none.db"), 0)), "-1 ");
    EXPECT_EQ(Said(SyslogngWorkingDbCheck(folder_.path(), 0)), "-1 Working database is not regular file");
}

}  // namespace
