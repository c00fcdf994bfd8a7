// Hostile values through every path that reaches SQL. SQLite's authorizer sees what each statement does.
#include <dlfcn.h>

#include <CLI/CLI.hpp>
#include <functional>

#include "accounting.h"
#include "common/handles.h"
#include "dbhandler.h"
#include "dbutil.h"
#include "logger.h"
#include "store/failure.h"
#include "tests/reliability/injection.h"
#include "tests/support/clock.h"
#include "tools/quorlog/commands/commands.h"

// Every connection of the library is watched, and does not wait for the disk.
DBConnect_tag* QUORDBConnect(const char* host, const char* user, const char* password, const char* path) {
    static const auto real = reinterpret_cast<decltype(&QUORDBConnect)>(dlsym(RTLD_NEXT, "QUORDBConnect"));
    DBConnect_tag* connection = real(host, user, password, path);
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
    Hostile hostile_;
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
    const auto keep = [](DBResult_tag* result, void* text) {
        *static_cast<std::string*>(text) = QUORDBFetchField(result, 0, "msg");
        return 0;
    };
    const std::pair<Actions, std::function<bool()>> calls[] = {
        {{}, [&] { return select("logs", nobody) == 0 && rows == 0; }},
        {{}, [&] { return SyslogDBSelectCount(path_, nobody, nullptr, nullptr) == 0; }},
        {{"DELETE logs"}, [&] { return SyslogDBDelete(path_, nobody) == 0; }},
        {{},
         [&] {
             return select("logs", {{SYSLOG_ATTRI_ID, 0, "1 " + hostile, {}}}) <= 0;
         }},
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
        hostile = hostile_.value();
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
        const std::string text = hostile_.value();
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
        const std::string device = hostile_.argument();
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
    EXPECT_EQ(SqliteFile(path).query("SELECT count(*) FROM (SELECT device, sum(eps) FROM eps GROUP BY device EXCEPT "
                                     "SELECT device, count FROM histogram)"),
              Strings{"0"});
}

// quorlog with hostile arguments.
class InjectionQuorlog : public Injection {
  protected:
    using Row = std::array<std::string, 4>;

    // The exit status; the output in `out_`.
    int quorlog(Strings arguments) {
        CLI::App app;
        int status = 0;
        cli::AddCommands(app, status);
        std::reverse(arguments.begin(), arguments.end());
        testing::internal::CaptureStdout();
        testing::internal::CaptureStderr();
        try {
            app.parse(arguments);
        } catch (const std::runtime_error&) {  // wrong usage, or what the program itself refuses
            status = 2;
        }
        testing::internal::GetCapturedStderr();
        out_ = testing::internal::GetCapturedStdout();
        return status;
    }

    void fill() {
        SqliteFile file(path_);
        file.run("BEGIN; DELETE FROM logs");
        for (int id = 1; id <= 300; ++id) {
            Row& row = rows_[id];
            std::generate(row.begin(), row.end(), [this] { return "x" + hostile_.argument(); });
            char* insert = sqlite3_mprintf("INSERT INTO logs(id, host, prog, fac, msg) VALUES(%d, %Q, %Q, %Q, %Q)", id,
                                           row[0].c_str(), row[1].c_str(), row[2].c_str(), row[3].c_str());
            file.run(insert);
            sqlite3_free(insert);
        }
        file.run("COMMIT");
    }

    // The rows whose field holds the value, or is the value.
    Strings idsOf(size_t field, const std::string& value) const {
        Strings ids;
        for (const auto& [id, row] : rows_) {
            if (field == 3 ? row[field].find(value) != std::string::npos : row[field] == value) {
                ids.push_back(std::to_string(id));
            }
        }
        return ids;
    }

    std::map<int, Row> rows_;
    std::string out_;
};

TEST_F(InjectionQuorlog, FiltersFindAndDeleteTheirRowsAlone) {
    constexpr const char* options[] = {"--host=", "--program=", "--facility=", "--keyword="};
    for (int i = 0; i < 4000; ++i) {
        if (rows_.size() < 200) {
            fill();
        }
        const size_t kind = hostile_.number(4);
        const auto any = std::next(rows_.begin(), static_cast<long>(hostile_.number(rows_.size())));
        const std::string value = i % 2 == 0 ? any->second[kind] : "x" + hostile_.argument();
        const Strings ids = idsOf(kind, value);
        if (i % 7 != 0) {
            ASSERT_EQ(quorlog({"search", "--format=ndjson", "--db=" + path_, options[kind] + value}), ids.empty());
            ASSERT_EQ(std::count(out_.begin(), out_.end(), '\n'), static_cast<long>(ids.size())) << value;
            for (const std::string& id : ids) {
                ASSERT_NE(out_.find("{\"id\":" + id + ","), std::string::npos) << value;
            }
            ASSERT_EQ(TakeActions(), Actions()) << value;
            continue;
        }
        const bool refused = kind == 3 && value.find_first_of("*?\xff\xc3\xef") != std::string::npos;
        ASSERT_EQ(quorlog({"delete", "--yes", "--db=" + path_, options[kind] + value}), refused ? 2 : ids.empty());
        ASSERT_EQ(TakeActions(), refused || ids.empty() ? Actions() : Actions{"DELETE logs"}) << value;
        for (const std::string& id : refused ? Strings() : ids) {
            rows_.erase(std::stoi(id));
        }
        ASSERT_EQ(SqliteFile(path_).query("SELECT id FROM logs ORDER BY id"), idsOf(3, "")) << value;
    }
}

// What has to be a number, a name, a pattern or a file is refused before a database is asked.
TEST_F(InjectionQuorlog, RefusesWhatIsNone) {
    const std::list<std::string> calls = Tokenize(
        "search --level=|search --from=|search --to=|search --before=|search --glob=\xff|count --table=|count "
        "--limit=|count --db=|delete --yes --level=|values |values host --offset=|names |events list --limit=|"
        "events list --db=|events clear --yes --db=|stats eps --last=|stats top --db=|db info --db=|db wal --db=|"
        "db limit --yes |db create --db=\"$(",
        "|");
    for (const std::string& call : calls) {
        for (int i = 0; i < 100; ++i) {
            std::list<std::string> words = Tokenize(call, " ");
            words.back() += "'" + hostile_.argument();
            ASSERT_EQ(quorlog({words.begin(), words.end()}), 2) << call << words.back();
            ASSERT_EQ(TakeActions(), Actions()) << call << words.back();
        }
    }
}

}  // namespace
}  // namespace quor::test
