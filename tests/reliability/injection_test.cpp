// Hostile values through every path that reaches SQL. SQLite's authorizer sees what each statement does.
#include <dlfcn.h>
#include <gtest/gtest.h>
#include <sqlite3.h>

#include <random>

#include "common/guards.h"
#include "dbhandler.h"
#include "dbutil.h"
#include "support/sqlite_file.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

// Actions of SQLite beside reading and calling its functions.
std::vector<int>& actions() {
    static std::vector<int> seen;
    return seen;
}

int watch(void* /*context*/, int action, const char*, const char*, const char*, const char*) {
    if (action != SQLITE_SELECT && action != SQLITE_READ && action != SQLITE_FUNCTION) {
        actions().push_back(action);
    }
    return SQLITE_OK;
}

}  // namespace

// Every connection of the library is watched.
DBConnect_tag* QUORDBConnect(const char* host, const char* user, const char* password, const char* path) {
    static const auto real = reinterpret_cast<decltype(&QUORDBConnect)>(dlsym(RTLD_NEXT, "QUORDBConnect"));
    DBConnect_tag* connection = real(host, user, password, path);
    if (connection != nullptr) {
        sqlite3_set_authorizer(static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection)), watch, nullptr);
    }
    return connection;
}

namespace quor::test {
namespace {

class Injection : public testing::Test {
  protected:
    Injection() {
        SqliteFile(path_).run(
            "CREATE TABLE logs(id INTEGER PRIMARY KEY, host TEXT, ip TEXT, fac TEXT, prio TEXT, llevel TEXT GENERATED "
            "ALWAYS AS (prio) VIRTUAL, tag TEXT, utcsec INTEGER, tzoffset TEXT, ldate TEXT, ltime TEXT, prog TEXT, "
            "msg TEXT); CREATE TABLE histogram(id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);"
            "INSERT INTO logs(id, host, msg) VALUES(1, 'kept', 'kept'), (2, 'other', 'other')");
        bytes_ = ReadFile(path_);
    }

    // Pieces that mean something to SQL, and bytes that mean nothing.
    std::string value() {
        static const std::vector<std::string> pieces = {"'",
                                                        "\"",
                                                        ";",
                                                        "--",
                                                        "/*",
                                                        "*/",
                                                        "[",
                                                        "]",
                                                        "\\",
                                                        "%",
                                                        "_",
                                                        "`",
                                                        "\xff",
                                                        "\xc3",
                                                        " OR ",
                                                        "1=1",
                                                        ")",
                                                        "(",
                                                        "''",
                                                        "x",
                                                        "\x1b[",
                                                        "\n",
                                                        "*",
                                                        "?",
                                                        "DROP TABLE logs",
                                                        "DELETE FROM logs",
                                                        "UNION SELECT"};
        std::string text;
        for (auto left = random_() % 8; left > 0; --left) {
            text += random_() % 12 == 0 ? std::string(1, '\0') : pieces[random_() % pieces.size()];
        }
        return text;
    }

    static int count(_SYSLOG_LOG_DATA_tag& /*record*/, void* rows) {
        ++*static_cast<int*>(rows);
        return 0;
    }

    TempFolder folder_;
    std::string path_ = folder_.path("logs.db");
    std::string bytes_;
    std::mt19937 random_{2024};
};

// Values that the library escapes: a text that is nobody's finds nothing, and nothing but reading happens.
TEST_F(Injection, EscapedValuesOnlyCompare) {
    for (int i = 0; i < 10000; ++i) {
        const std::string hostile = "nobody" + value();
        std::list<_SYSLOG_SQL_COND_tag> conditions{{SYSLOG_ATTRI_HOST, 0, hostile, {}}};
        conditions.front().op = std::vector<int>{0, 6, 8}[static_cast<size_t>(i) % 3];
        conditions.front().orList.push_back({SYSLOG_ATTRI_MSG, conditions.front().op, hostile, {}});
        int rows = 0;
        actions().clear();
        ASSERT_EQ(SyslogDBSelect(path_, conditions, nullptr, nullptr, count, &rows, false), 0) << hostile;
        ASSERT_EQ(rows, 0) << hostile;
        ASSERT_EQ(SyslogDBSelectCount(path_, conditions, nullptr, nullptr), 0) << hostile;
        ASSERT_TRUE(actions().empty()) << hostile;
        if (i % 10 == 0) {
            ASSERT_EQ(SyslogDBDelete(path_, conditions), 0) << hostile;
            ASSERT_EQ(actions(), std::vector<int>{SQLITE_DELETE}) << hostile;
        }
    }
    EXPECT_EQ(SqliteFile(path_).query("SELECT group_concat(host) FROM logs"), std::vector<std::string>{"kept,other"});
}

// Values that the library documents as unescaped: the statement may fail or read other rows, but stays the one
// statement that it was, and writes nothing that it was not to write.
TEST_F(Injection, UnescapedValuesNeverRunAnotherStatement) {
    for (int i = 0; i < 10000; ++i) {
        const std::string hostile = value();
        std::list<_SYSLOG_SQL_COND_tag> number{{SYSLOG_ATTRI_ID, 0, "1 " + hostile, {}}};
        std::string table = "logs " + hostile;
        std::list<_SYSLOG_SQL_COND_tag> none;
        std::string attribute = hostile;
        std::list<std::string> values;
        int rows = 0;
        actions().clear();
        (void)SyslogDBSelect(path_, number, nullptr, nullptr, count, &rows, false);
        (void)SyslogDBSelectByTable(path_, table, none, nullptr, nullptr, count, &rows, false);
        (void)SyslogDBHistGetSingle(path_, hostile);
        EXPECT_EQ(SyslogDBAttriValueGet(path_, attribute, nullptr, values), -1) << hostile;
        ASSERT_TRUE(actions().empty()) << hostile;
    }
    EXPECT_EQ(ReadFile(path_), bytes_);
    TakeSystemLog();
}

// Text that is escaped first is stored as it was, up to a zero byte.
TEST_F(Injection, EscapedTextIsStoredAsItWas) {
    DBHandler handle(path_, "");
    ASSERT_EQ(handle.DBCon(), 0);
    ASSERT_EQ(handle.DBTranStart(), 0);
    for (int i = 0; i < 10000; ++i) {
        const std::string hostile = value();
        actions().clear();
        ASSERT_EQ(handle.DBExecute("UPDATE logs SET msg='" + handle.DBCmdEscape(hostile) + "' WHERE id=1"), 0);
        ASSERT_EQ(actions(), std::vector<int>{SQLITE_UPDATE}) << hostile;
        const auto compare = [](DBResult_tag* result, void* expected) {
            EXPECT_STREQ(QUORDBFetchField(result, 0, "msg"), static_cast<std::string*>(expected)->c_str());
            return 0;
        };
        std::string expected = hostile;
        ASSERT_EQ(handle.DBExecute("SELECT msg FROM logs WHERE id=1", compare, &expected), 0);
    }
    EXPECT_EQ(handle.DBTranEnd(), 0);
    handle.DBDiscon();
    EXPECT_EQ(SqliteFile(path_).query("SELECT msg FROM logs WHERE id=2"), std::vector<std::string>{"other"});
}

}  // namespace
}  // namespace quor::test
