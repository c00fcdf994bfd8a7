#include "dbhandler.h"

#include "quor/quordb.h"
#include "support/db_spy.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

class Handle : public testing::Test {
  protected:
    Handle() {
        SqliteFile(path_).run("CREATE TABLE logs(utcsec); INSERT INTO logs VALUES(1), (2)");
        SpyOnDb() = {};
        TakeSystemLogTexts();
    }
    ~Handle() override { handle_.DBDiscon(); }

    std::string count() { return SqliteFile(path_).query("SELECT count(*) FROM logs").front(); }

    const TempFolder folder_;
    const std::string path_ = folder_.path("log.db");
    DBHandler handle_{path_, ""};
};

int countRows(DBResult_tag* result, void* rows) {
    *static_cast<int*>(rows) = QUORDBNumRows(result);
    return -1;  // must not make the statement fail
}

TEST_F(Handle, WorksWhileItIsConnected) {
    EXPECT_EQ(handle_.DBExecute("DELETE FROM logs"), -1);
    EXPECT_EQ(TakeSystemLogTexts(), Strings()) << "only the callback form reports";
    EXPECT_EQ(handle_.DBWalCheckpoint(false), -1);
    EXPECT_EQ(handle_.DBExecute("DELETE FROM logs", nullptr, nullptr), -1);
    EXPECT_EQ(handle_.DBLogCountGet(), ~0ULL);
    EXPECT_FALSE(handle_.isConnected());
    EXPECT_EQ(handle_.DBCon(), 0);
    EXPECT_EQ(handle_.DBCon(), -1);
    EXPECT_TRUE(handle_.isConnected());
    EXPECT_EQ(TakeSystemLogTexts(), Strings({"Fail to force WAL checkpoint(FULL)", "DB is not connected",
                                             "DB is not connected", "Connection is already existed"}));
    int rows = 0;
    EXPECT_EQ(handle_.DBExecute("SELECT * FROM logs", countRows, &rows), 0);
    EXPECT_EQ(rows, 2);
    EXPECT_EQ(handle_.DBExecute("SELECT * FROM logs", nullptr, nullptr), 0);
    EXPECT_EQ(handle_.DBExecute("SELECT * FROM nowhere", countRows, &rows), -1);
    EXPECT_EQ(handle_.DBDiscon(), 0);
    EXPECT_FALSE(handle_.isConnected());
    EXPECT_EQ(handle_.DBDiscon(), 0);
}

TEST_F(Handle, TransactionsKeepTheirFlag) {
    EXPECT_EQ(handle_.DBTranStart(), -1);
    handle_.DBCon();
    EXPECT_EQ(handle_.DBTranEnd(), -1);
    EXPECT_EQ(handle_.DBTranRollback(), -1);
    EXPECT_EQ(handle_.DBTranStart(), 0);
    EXPECT_EQ(handle_.DBTranStart(), -1);
    EXPECT_EQ(handle_.isInTran(), 1);
    EXPECT_EQ(TakeSystemLogTexts(),
              Strings({"Fail to check sanity (DBTranStart)", "Fail to check sanity (DBTranEnd)",
                       "Fail to check sanity (DBTranRollback)", "Fail to check sanity (DBTranStart)"}));
    handle_.DBExecute("DELETE FROM logs");
    EXPECT_EQ(handle_.DBTranRollback(), 0);
    EXPECT_EQ(handle_.isInTran(), 0);
    EXPECT_EQ(count(), "2");
    handle_.DBTranStart();
    handle_.DBExecute("DELETE FROM logs");
    EXPECT_EQ(handle_.DBTranEnd(), 0);
    EXPECT_EQ(count(), "0");
}

TEST_F(Handle, FailedTransactionStatementsLeaveTheFlag) {
    using Case = std::tuple<const char*, int (DBHandler::*)(), int, const char*>;
    handle_.DBCon();
    for (const auto& [statement, operation, flag, message] :
         {Case{"BEGIN;", &DBHandler::DBTranStart, 0, "Fail to begin transaction"},
          Case{"END;", &DBHandler::DBTranEnd, 1, "Fail to end transaction"},
          Case{"ROLLBACK;", &DBHandler::DBTranRollback, 1, "Fail to rollback transaction"}}) {
        SpyOnDb().failing = statement;
        if (flag == 1 && handle_.isInTran() == 0) {
            handle_.DBTranStart();
        }
        EXPECT_EQ((handle_.*operation)(), -1);
        EXPECT_EQ(handle_.isInTran(), flag);
        EXPECT_EQ(TakeSystemLogTexts(), Strings({message})) << "and nothing from the error handler";
    }
    handle_.DBDiscon();
    EXPECT_EQ(handle_.isInTran(), 1) << "disconnecting changed the flag";
}

TEST_F(Handle, EscapesCountsAndFindsTables) {
    EXPECT_EQ(handle_.DBCmdEscape("''"), "''''");
    EXPECT_EQ(handle_.DBCmdEscape("a'b\\\"%_"), "a''b\\\"%_");
    handle_.DBCon();
    EXPECT_EQ(handle_.DBLogCountGet(), 2U);
    EXPECT_EQ(handle_.DBInfoCntGet(), 2U);
    EXPECT_EQ(handle_.DBcheckTableExist("logs"), 1);
    EXPECT_EQ(handle_.DBcheckTableExist("LOG"), 0);
    EXPECT_EQ(TakeSystemLogTexts(), Strings());
    EXPECT_EQ(handle_.DBcheckTableExist("x'; DROP TABLE logs; --"), 0);
    EXPECT_EQ(TakeSystemLogTexts().back(),
              "Fail to execute SQL command : SELECT count(*) as count_result FROM sqlite_master WHERE type='table' AND "
              "name='x'; DROP TABLE logs; --'");
    EXPECT_EQ(count(), "2");
}

TEST_F(Handle, ChecksPointsTheLogAndRemovesItsFiles) {
    SqliteFile(path_).run("PRAGMA journal_mode=WAL");
    handle_.DBCon();
    handle_.DBExecute("DELETE FROM logs WHERE utcsec = 1");
    EXPECT_EQ(handle_.DBWalCheckpoint(false), 0);
    EXPECT_TRUE(std::filesystem::exists(path_ + "-wal"));
    EXPECT_EQ(handle_.DBWalCheckpoint(true), 0);
    EXPECT_FALSE(std::filesystem::exists(path_ + "-wal"));
    EXPECT_FALSE(std::filesystem::exists(path_ + "-shm"));
    handle_.DBDiscon();
    EXPECT_EQ(count(), "1");
    SpyOnDb().failing = "wal_checkpoint(FULL);";
    handle_.DBCon();
    EXPECT_EQ(handle_.DBWalCheckpoint(true), -1);
    EXPECT_EQ(TakeSystemLogTexts(), Strings({"Fail to force WAL checkpoint(FULL)"}));
}

}  // namespace
