#include <sqlite3.h>

#include <climits>
#include <cstring>
#include <thread>

#include "common/handles.h"
#include "tests/support/testing.h"

using namespace quor::test;
using quor::Adopt;
using quor::Connection;

namespace {

class Database : public ::testing::Test {
  protected:
    Database() {
        file_.run("CREATE TABLE t(id INTEGER PRIMARY KEY, name TEXT); INSERT INTO t(name) VALUES('a'), ('b'), ('c');");
        connection_ = connect(path_);
    }

    static Connection connect(const std::string& path) {
        return Connection(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str()));
    }

    int execute(const std::string& sql) {
        result_.reset();
        return QUORDBExecute(connection_.get(), sql.c_str(), Adopt(result_));
    }

    int selectLimit(const std::string& sql, unsigned int count, unsigned int skip) {
        result_.reset();
        return QUORDBSelectLimit(connection_.get(), sql.c_str(), count, skip, Adopt(result_));
    }

    int errorCode() { return sqlite3_errcode(static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection_.get()))); }

    std::string field(unsigned int row, const char* column) {
        const char* text = QUORDBFetchField(result_.get(), row, column);
        return text != nullptr ? text : "NULL";
    }

    std::string names() {
        std::string all;
        for (unsigned int row = 0; QUORDBFetchRow(result_.get(), &row) >= 0;) {
            all += field(row, "name");
        }
        return all;
    }

    TempFolder folder_;
    std::string path_ = folder_.path("logs.db");
    SqliteFile file_{path_};
    Connection connection_;
    quor::Result result_;
};

TEST_F(Database, OnlyAnExistingFileIsOpened) {
    for (const std::string& path : {std::string(), folder_.path(), folder_.path("absent.db"), std::string(":memory:"),
                                    "file:" + path_, path_ + "?mode=ro"}) {
        EXPECT_EQ(connect(path), nullptr) << path;
    }
    EXPECT_EQ(access(folder_.path("absent.db").c_str(), F_OK), -1);
    EXPECT_NE(connect(folder_.write("damaged.db", "not a database")), nullptr);  // noticed when it is read
}

TEST_F(Database, WhatIsNotOneGoodStatementIsNotRunAndLeavesItsErrorOnTheConnection) {
    constexpr char kOneOnly[] = "only one statement can be run at a time";
    const std::tuple<const char*, int, const char*> cases[] = {
        {" -- nothing\n;", SQLITE_EMPTY, "empty statement"},
        {"DELETE FROM t WHERE id=1; DROP TABLE t", SQLITE_ERROR, kOneOnly},
        {"SELECT 1;;/* */ -- x\n DELETE FROM t", SQLITE_ERROR, kOneOnly},
        {"SELECT * FROM absent", SQLITE_ERROR, "no such table: absent"},
        {"INSERT INTO t(id) VALUES(1)", SQLITE_CONSTRAINT, "UNIQUE constraint failed: t.id"}};
    for (const auto& [sql, code, text] : cases) {
        EXPECT_TRUE(execute(sql) < 0 && result_ == nullptr) << sql;
        EXPECT_EQ(errorCode(), code) << sql;
        EXPECT_STREQ(QUORDBErrorGet(connection_.get()), text);
        EXPECT_LT(selectLimit(sql, 1, 0), 0) << sql;
    }
    EXPECT_EQ(file_.query("SELECT count(*) FROM t"), Strings{"3"});
    EXPECT_EQ(execute("SELECT name FROM t;; /* end */ ; -- of it"), 0);
    EXPECT_EQ(names(), "abc");
}

TEST_F(Database, LimitStandsInFrontOfWhateverEndsTheText) {
    const std::tuple<const char*, unsigned int, unsigned int, const char*> cases[] = {
        {"SELECT name FROM t;", 2, 1, "bc"},
        {"SELECT name FROM t -- to the end", 1, 1, "b"},
        {"SELECT name FROM t /* not closed", 1, 0, "a"},
        {" ;SELECT name FROM t; /* ; */ ;", 1, 2, "c"},
        {"SELECT name FROM t WHERE name != ';--/*' AND \"name\" <> '''' ORDER BY [name] DESC", 2, 0, "cb"},
        {"SELECT name FROM t", 0, 2, "c"},
        {"SELECT name FROM t", UINT_MAX, UINT_MAX, ""}};
    for (const auto& [sql, count, skip, expected] : cases) {
        EXPECT_EQ(selectLimit(sql, count, skip), 0) << sql;
        EXPECT_EQ(names(), expected) << sql << " " << count << " " << skip;
    }
    EXPECT_LT(selectLimit("SELECT name FROM t LIMIT 1", 2, 0), 0);
}

TEST_F(Database, UnknownColumnsAndRowsHaveNoField) {
    ASSERT_EQ(execute("SELECT * FROM t"), 0);
    EXPECT_EQ(field(0, "nam") + field(0, "names") + field(0, "NAME") + field(0, ""), "NULLNULLNULLNULL");
    EXPECT_EQ(field(3, "name") + field(UINT_MAX, "name"), "NULLNULL");
    EXPECT_EQ(QUORDBFetchField(result_.get(), 0, nullptr), nullptr);
    EXPECT_LT(QUORDBFetchRow(result_.get(), nullptr) + QUORDBExecute(connection_.get(), nullptr, nullptr), -1);
}

TEST_F(Database, ResultOutlivesItsConnectionAndSchema) {
    ASSERT_EQ(execute("SELECT * FROM t"), 0);
    file_.run("DROP TABLE t");
    connection_.reset();
    EXPECT_EQ(names(), "abc");
}

TEST_F(Database, LockedDatabaseIsWaitedForThenFails) {
    file_.run("BEGIN IMMEDIATE");
    std::thread writer([this] {
        usleep(200'000);
        file_.run("COMMIT");
    });
    EXPECT_EQ(execute("INSERT INTO t(name) VALUES('d')"), 0);
    writer.join();
    file_.run("BEGIN IMMEDIATE");
    EXPECT_LT(execute("INSERT INTO t(name) VALUES('e')"), 0);
    EXPECT_EQ(errorCode(), SQLITE_BUSY);
}

// As long as the log writer runs, it alone restarts the write-ahead log: it checkpoints from 1,000 pages on.
TEST_F(Database, CheckpointsLongAfterTheLogWriter) {
    ASSERT_EQ(execute("PRAGMA wal_autocheckpoint"), 0);
    EXPECT_EQ(field(0, "wal_autocheckpoint"), "10000");
}

TEST_F(Database, FieldsAreTheTextOfAnyValue) {
    ASSERT_EQ(execute("SELECT 1 AS twice, 2 AS i, 3 AS twice, NULL AS n, 1.5 AS r, x'6162' AS b, x'' AS z"), 0);
    for (const auto& [column, text] :
         {std::pair("twice", "1"), std::pair("i", "2"), std::pair("twice", "1"), std::pair("n", "NULL"),
          std::pair("r", "1.5"), std::pair("b", "ab"), std::pair("z", ""), std::pair("i", "2")}) {
        EXPECT_EQ(field(0, column), text) << column;
    }
    EXPECT_EQ(QUORDBExecute(connection_.get(), "UPDATE t SET name = 'x'", nullptr), 0);
    EXPECT_EQ(execute("CREATE TABLE empty(a)"), 0);
    EXPECT_EQ(field(0, "a"), "NULL") << "no columns";
}

// Rows of every length, more than memory holds, read in order and at random.
TEST_F(Database, AnySizeOfResultIsReadBackWhole) {
    setenv("TMPDIR", folder_.path().c_str(), 1);
    const std::string length =
        "CASE WHEN i % 100000 < 64 THEN 65480 + i % 100000 WHEN i % 100000 = 77 THEN 10000000 ELSE 200 END";
    ASSERT_EQ(execute("WITH RECURSIVE n(i) AS (SELECT 0 UNION ALL SELECT i + 1 FROM n LIMIT 400000) SELECT i, " +
                      length + " AS length, printf('%0*d', " + length + ", i) AS text FROM n"),
              0);
    unsetenv("TMPDIR");
    EXPECT_NE(ReadFile("/proc/self/maps").find(folder_.path()), std::string::npos) << "not in a temporary file";
    constexpr unsigned int rows = 400'000;
    ASSERT_EQ(QUORDBNumRows(result_.get()), 400'000);
    for (unsigned int i = 0; i < rows; ++i) {
        const std::string text = field(i, "text");
        ASSERT_EQ(text.size(), std::stoul(field(i, "length")));
        ASSERT_EQ(std::stoul(text.substr(text.size() - 9)), i);
        if (const unsigned int other = i * 7919 % rows; i % 64 < 2) {
            ASSERT_EQ(field(other, "i"), std::to_string(other));
        }
    }
}

TEST(Null, IsAFailure) {
    char out[4] = "x";
    EXPECT_EQ(QUORDBConnect(nullptr, nullptr, nullptr, nullptr), nullptr);
    EXPECT_TRUE(QUORDBExecute(nullptr, "SELECT 1", nullptr) < 0 && QUORDBFetchField(nullptr, 0, "a") == nullptr);
    EXPECT_TRUE(QUORDBNumRows(nullptr) == 0 && QUORDBInternalDBHdlGet(nullptr) == nullptr);
    EXPECT_STREQ(QUORDBErrorGet(nullptr), "no database connection");
    EXPECT_LT(QUORDBEscapeStringEX2(nullptr, nullptr, 4, "a", 1) + QUORDBEscapeStringEX(nullptr, out, 0, "a", 1), -1);
    EXPECT_LT(QUORDBEscapeBackslashEX2(nullptr, out, 4, nullptr), 0);
}

TEST(Escape, DoublesQuotesAndMarksWildcards) {
    char out[16];
    EXPECT_EQ(QUORDBEscapeStringEX(nullptr, out, 16, "O'N''eil\n\xff", 10), 0);
    EXPECT_STREQ(out, "O''N''''eil\n\xff");
    EXPECT_EQ(QUORDBEscapeBackslashEX2(nullptr, out, 16, "a\\%_*?'"), 0);
    EXPECT_STREQ(out, "a\\\\\\%\\_*?'");
    EXPECT_EQ(QUORDBEscapeStringEX(nullptr, out, 5, "''", 2), 0);  // twice the length plus one
    EXPECT_STREQ(out, "''''");
    EXPECT_LT(QUORDBEscapeStringEX(nullptr, out, 4, "''", 2), 0);
    EXPECT_STREQ(out, "");
}

}  // namespace
