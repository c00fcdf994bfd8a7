// Hostile values through every path that reaches SQL. SQLite's authorizer sees what each statement does.
#include <functional>
#include <random>
#include <set>

#include "accounting.h"
#include "common.h"
#include "common/handles.h"
#include "dbhandler.h"
#include "dbutil.h"
#include "logger.h"
#include "tests/support/clock.h"
#include "tests/support/real.h"
#include "tests/support/testing.h"

namespace quor::test {
namespace {

// May hold zero bytes.
std::string HostileValue(std::mt19937& random) {
    static const std::list<std::string> pieces =
        Tokenize("'|''|\"|;|--|/*|*/|[|]|(|)|\\|%|_|`|*|?|x| OR |1=1|%s%n|$(id)>|<b>|\t|\n|\x01|\x1b[|\x7f|\xff|\xc3|"
                 "\xef\xbf\xbd|UNION SELECT|DROP TABLE logs|DELETE FROM log",
                 "|");
    std::string text;
    for (size_t left = random() % 8; left > 0; --left) {
        const auto piece = std::next(pieces.begin(), static_cast<long>(random() % pieces.size()));
        text += random() % 30 == 0 ? std::string(1, '\0') : *piece;
    }
    return text;
}

using Actions = std::set<std::string>;

// What statements did beside reading: "INSERT log", "BEGIN", or SQLite's number of any other action with its object.
Actions seenActions;

Actions TakeActions() {
    return std::exchange(seenActions, {});
}

int Watch(void* /*context*/, int action, const char* object, const char*, const char*, const char*) {
    static const std::map<int, std::string> writing = {
        {SQLITE_INSERT, "INSERT "}, {SQLITE_UPDATE, "UPDATE "}, {SQLITE_DELETE, "DELETE "}, {SQLITE_TRANSACTION, ""}};
    static const std::set<int> reading = {SQLITE_SELECT, SQLITE_READ, SQLITE_FUNCTION, SQLITE_RECURSIVE};
    const auto known = writing.find(action);
    if (reading.count(action) == 0) {
        seenActions.insert((known != writing.end() ? known->second : std::to_string(action) + " ") + OrEmpty(object));
    }
    return SQLITE_OK;
}

}  // namespace
}  // namespace quor::test

// Every connection of the library is watched, and does not wait for the disk.
DBConnect_tag* QUORDBConnect(const char* host, const char* user, const char* password, const char* path) {
    DBConnect_tag* connection = quor::test::Real(QUORDBConnect, __func__)(host, user, password, path);
    if (connection != nullptr) {
        auto* db = static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection));
        sqlite3_exec(db, "PRAGMA synchronous=OFF", nullptr, nullptr, nullptr);
        sqlite3_set_authorizer(db, quor::test::Watch, nullptr);
    }
    return connection;
}

namespace quor::test {
namespace {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

class Injection : public testing::Test {
  protected:
    Injection() {
        SqliteFile(path_).run(
            "CREATE TABLE histogram(id, device, count); CREATE TABLE logs(id INTEGER PRIMARY KEY, msg, prio, llevel "
            "GENERATED ALWAYS AS (prio), ldate, host, prog, fac, ltime, ip, tag, utcsec, tzoffset);"
            "INSERT INTO logs(id, host, msg) VALUES(1, 'kept', 'kept'), (2, 'other', 'other')");
        for (const char* path : {paths::kAccountingDb, paths::kEventDb}) {
            WriteFile(path, "");
            std::filesystem::remove(path);
        }
        TakeActions();
    }
    ~Injection() override { TakeSystemLog(); }

    TempFolder folder_;
    std::string path_ = folder_.path("logs.db");
    std::mt19937 random_{2024};  // the same values in every run
};

// An escaped value only compares. One that the library documents as unescaped may read other rows or fail, but its
// statement stays the only one, and writes nothing that it was not to write.
TEST_F(Injection, EveryStatementStaysWhatItIs) {
    const std::string copy = folder_.write("copy.db", ReadFile(path_));
    DBHandler handle(copy, "");
    ASSERT_TRUE(handle.DBCon() == 0 && handle.DBTranStart() == 0);
    std::string hostile;
    Conditions nobody;
    std::list<std::string> values;
    int rows = 0;
    const auto count = [](auto& /*record*/, void* seen) {
        ++*static_cast<int*>(seen);
        return 0;
    };
    const auto select = [&](std::string table, Conditions conditions) {
        return SyslogDBSelectByTable(path_, table, conditions, nullptr, nullptr, count, &rows, false);
    };
    const auto byId = [&] { return select("logs", {{SYSLOG_ATTRI_ID, 0, "1 " + hostile, {}}}) <= 0; };
    const auto keep = [](DBResult_tag* result, void* text) {
        *static_cast<std::string*>(text) = QUORDBFetchField(result, 0, "msg");
        return 0;
    };
    const std::pair<Actions, std::function<bool()>> calls[] = {
        {{}, [&] { return select("logs", nobody) == 0 && rows == 0; }},
        {{}, [&] { return SyslogDBSelectCount(path_, nobody, nullptr, nullptr) == 0; }},
        {{"DELETE logs"}, [&] { return SyslogDBDelete(path_, nobody) == 0; }},
        {{}, byId},
        {{}, [&] { return select("logs " + hostile, {}) <= 0; }},
        {{}, [&] { return SyslogDBHistGetSingle(path_, hostile) == 0; }},
        {{}, [&] { return SyslogDBAttriValueGet(path_, hostile, nullptr, values) == -1; }},
        {{"UPDATE logs"}, [&] {
             std::string stored;
             return handle.DBExecute("UPDATE logs SET msg='" + handle.DBCmdEscape(hostile) + "' WHERE id=1") == 0 &&
                    handle.DBExecute("SELECT msg FROM logs WHERE id=1", keep, &stored) == 0 &&
                    strcmp(stored.c_str(), hostile.c_str()) == 0;
         }}};
    TakeActions();
    for (int i = 0; i < 10000; ++i) {
        hostile = HostileValue(random_);
        nobody = {{SYSLOG_ATTRI_HOST, 0, "no" + hostile, {}}};
        nobody.front().orList = {{SYSLOG_ATTRI_MSG, 6, "no" + hostile, {}}, {SYSLOG_ATTRI_MSG, 8, "no" + hostile, {}}};
        rows = 0;
        for (const auto& [allowed, call] : calls) {
            ASSERT_TRUE(call()) << hostile;
            ASSERT_EQ(TakeActions(), allowed) << hostile;
        }
    }
    ASSERT_EQ(handle.DBTranEnd() + handle.DBDiscon(), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT host, msg FROM logs"), (Strings{"kept", "kept", "other", "other"}));
    EXPECT_EQ(SqliteFile(copy).query("SELECT msg FROM logs WHERE id = 2"), Strings{"other"});
}

// Events are stored unescaped, each by one INSERT: whole when they hold no apostrophe; otherwise the statement is
// refused, or touches the table of events alone.
TEST_F(Injection, EventsTouchNothingButTheirTable) {
    using Record = int (*)(Logger&, const std::string&);
    const std::tuple<std::string, std::string, Record> recorders[] = {
        // what stands before and after the text
        {"SYSTEM ", "", [](auto& log, auto& text) { return log.LogAdd(paths::kEventDb, 0, "SYSTEM", text); }},
        {"", " x", [](auto& log, auto& text) { return log.LogAdd(paths::kEventDb, 0, text, "x"); }},
        {"SYSTEM Event detection: Received log which contains [", "]. Log content: [x]",
         [](auto& log, auto& text) { return log.LogAddNotifyKw(text, "x"); }},
        {"SYSTEM ", " was cleared by x", [](auto& log, auto& text) { return log.LogAddLogClear(text, "x"); }}};
    const Actions possible{"BEGIN", "COMMIT", "INSERT log", "UPDATE log"};
    Logger log;
    ASSERT_EQ(log.LogAddVolFull(), 0);
    SqliteFile file(paths::kEventDb);
    file.run("CREATE TABLE logs(id INTEGER); INSERT INTO logs VALUES(7)");
    const std::string newest = "SELECT id, user || ' ' || event FROM log ORDER BY id DESC LIMIT 1";
    Strings last = file.query(newest);
    for (size_t i = 0; i < 10000; ++i) {
        const auto& [before, after, record] = recorders[i % std::size(recorders)];
        const std::string text = HostileValue(random_);
        const bool whole = text.find_first_of(std::string("'\0", 2)) == std::string::npos;
        const int result = record(log, text);
        const Strings stored = file.query(newest);
        ASSERT_EQ(stored != last, result == 0) << text;
        ASSERT_TRUE(!whole || (result == 0 && stored[1] == std::string(before).append(text).append(after))) << text;
        const Actions seen = TakeActions();
        ASSERT_TRUE(std::includes(possible.begin(), possible.end(), seen.begin(), seen.end())) << text;
        last = stored;
    }
    EXPECT_EQ(std::to_string(log.LogEnum(paths::kEventDb, 0, 0).size()), last[0]);
    // What an attacker who knows the statement can make of it.
    for (const auto& [text, result] : std::map<std::string, int>{
             {"x'); DELETE FROM log; --", -1},
             {"x'),(NULL,'2','0','admin','forged", 0},
             {"x'),(1,'0','0','admin','changed') ON CONFLICT(id) DO UPDATE SET event=excluded.event --", 0}}) {
        EXPECT_EQ(log.LogAdd(paths::kEventDb, 0, "SYSTEM", text), result) << text;
    }
    EXPECT_EQ(file.query("SELECT event FROM log WHERE id = 1 OR event = 'forged'"), (Strings{"changed", "forged"}));
    EXPECT_EQ(file.query("SELECT id FROM logs"), Strings{"7"});
}

TEST_F(Injection, DevicesAreCountedUnderTheirNames) {
    std::map<std::string, unsigned long long> counts;
    AccountingManager accounting;
    for (int i = 0; i < 10000; ++i) {
        SetClock(1000 + i / 100);
        std::string device = HostileValue(random_);
        device.resize(strlen(device.c_str()));
        EXPECT_EQ(accounting.LogInc(device), 0);
        ++counts[device];
    }
    SetClock(2000);
    EXPECT_EQ(accounting.CurEpsUpdate(), 0);
    ResetClock();
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
    EXPECT_EQ(TakeActions(), (Actions{"BEGIN", "COMMIT", "INSERT eps", "INSERT histogram"}));
    std::string path = paths::kAccountingDb;
    EXPECT_EQ(SyslogDBHistGet(path, 0), counts);
    const std::string other = "SELECT device, sum(eps) FROM eps GROUP BY 1 EXCEPT SELECT device, count FROM histogram";
    EXPECT_EQ(SqliteFile(path).query(other), Strings());
}

}  // namespace
}  // namespace quor::test
