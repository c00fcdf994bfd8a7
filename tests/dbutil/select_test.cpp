#include "dbutil.h"
#include "support/database.h"
#include "support/db_spy.h"

using namespace quor::test;

namespace {

// Collects ids, up to `most`.
struct Walk {
    Strings ids;
    size_t most = 1000;

    static int take(_SYSLOG_LOG_DATA_tag& record, void* context) {
        auto& walk = *static_cast<Walk*>(context);
        walk.ids.push_back(std::to_string(record.id));
        return walk.ids.size() >= walk.most ? 1 : 0;
    }
};

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

// Ids 1 to 10; odd ones are of host "odd".
class Select : public DatabaseTest {
  protected:
    Select() {
        run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg);"
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i+1 FROM n WHERE i < 10)"
            "INSERT INTO logs SELECT i, iif(i % 2, 'odd', 'even'), 'm' || i FROM n;"
            "CREATE TABLE other(id INTEGER PRIMARY KEY); INSERT INTO other VALUES(1)");
        SpyOnDb() = {};
    }

    static Conditions host(const char* name) { return {{SYSLOG_ATTRI_HOST, 0, name, {}}}; }

    // What happened to the statements that were sent since.
    static void expectStatements(const Strings& statements) {
        EXPECT_EQ(std::exchange(SpyOnDb().statements, {}), statements);
    }

    int select(Conditions conds, _SYSLOG_SQL_LIMIT_tag* limit, _SYSLOG_SQL_ORDER_tag* order) {
        return SyslogDBSelect(path_, conds, limit, order, Walk::take, &walk_, false);
    }

    Conditions none_;
    Conditions all_{{SYSLOG_ATTRI_MSG, 8, "**", {}}};
    Conditions odd_ = host("odd");
    _SYSLOG_SQL_ORDER_tag newest_{0, SYSLOG_ATTRI_ID};
    Walk walk_;
};

TEST_F(Select, PagesUnfilteredTablesByIdWindowAndOthersThroughTheLimitedSelect) {
    _SYSLOG_SQL_LIMIT_tag page{3, 2};
    _SYSLOG_SQL_LIMIT_tag large{(1ULL << 32) + 2, (1ULL << 33) + 1};  // the limited select takes the low 32 bits
    ASSERT_EQ(select(none_, &page, &newest_), 0);
    EXPECT_EQ(walk_.ids, Strings({"8", "7", "6"}));
    ASSERT_EQ(select(all_, &large, &newest_), 0);
    ASSERT_EQ(select(odd_, &large, &newest_), 0);
    EXPECT_EQ(walk_.ids, Strings({"8", "7", "6", "7", "5"}));
    const std::string maximum = "SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE ";
    expectStatements({maximum + "( id > totalCount - 5 AND id <= totalCount - 2) ORDER BY id desc",
                      maximum + "(msg GLOB '**') AND ( id > totalCount - 12884901891 AND id <= totalCount - "
                                "8589934593) ORDER BY id desc",
                      "SELECT * FROM logs WHERE (host = 'odd') ORDER BY id desc [2,1]"});
}

TEST_F(Select, WithoutAWindowGivesEveryRowThatIsTaken) {
    _SYSLOG_SQL_LIMIT_tag everything{0, 4};
    _SYSLOG_SQL_ORDER_tag oldest{7, SYSLOG_ATTRI_HOST};
    ASSERT_EQ(select(none_, &everything, &oldest), 0);
    ASSERT_EQ(select(none_, nullptr, nullptr), 0);
    EXPECT_EQ(walk_.ids.size(), 20U);
    expectStatements({"SELECT * FROM logs ORDER BY host asc", "SELECT * FROM logs"});
    EXPECT_EQ(SyslogDBSelect(path_, none_, nullptr, nullptr, nullptr, nullptr, false), 0);
    std::string other = "other";
    EXPECT_EQ(SyslogDBSelectByTable(path_, other, none_, nullptr, nullptr, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids.size(), 20U) << "a row of an unknown table was handed over";
    walk_.most = 21;
    EXPECT_EQ(select(none_, nullptr, &newest_), 0);
    EXPECT_EQ(walk_.ids.back(), "10") << "the walk ends when it is asked to";
}

TEST_F(Select, ReportsWhatFailed) {
    std::string relative = "log.db";
    std::string missing = folder_.path("none.db");
    std::string table = "nowhere";
    for (std::string* bad : {&relative, &missing}) {
        EXPECT_EQ(SyslogDBSelect(*bad, none_, nullptr, nullptr, nullptr, nullptr, false), -1);
        EXPECT_EQ(SyslogDBSelectCount(*bad, none_, nullptr, nullptr), -1);
        EXPECT_EQ(SyslogDBDelete(*bad, none_), -1);
    }
    expectStatements({});
    EXPECT_EQ(SyslogDBSelectByTable(path_, table, none_, nullptr, nullptr, nullptr, nullptr, false), -1);
    expectLog({"dbutil:464 Invalid syslog db path!", "dbutil:573 Invalid syslog db path!",
               "dbutil:653 Invalid syslog db path!", "fail to connect database (" + missing + ")",
               "fail to execute database command (SELECT * FROM nowhere)"});
    EXPECT_FALSE(std::filesystem::exists(missing));
}

TEST_F(Select, CountsByLargestIdUnlessFiltered) {
    run("DELETE FROM logs WHERE id IN (3, 4, 5)");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, all_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, odd_, nullptr, &newest_), 3);
    expectStatements({"SELECT max(rowid) FROM logs", "SELECT max(rowid) FROM logs WHERE (msg GLOB '**')",
                      "SELECT COUNT(*) FROM logs WHERE (host = 'odd') ORDER BY id desc"});

    _SYSLOG_SQL_LIMIT_tag beyond{1, 1};
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, &beyond, nullptr), -1) << "the only row was skipped";
    run("UPDATE logs SET id = 7000000000 WHERE id = 10");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), -1589934592) << "not the low 32 bits";

    std::string twoRows = "logs GROUP BY host";
    EXPECT_EQ(SyslogDBSelectCountByTable(path_, twoRows, none_, nullptr, nullptr), -2);
}

TEST_F(Select, DeletesOnlyWhatMatches) {
    for (const auto& [name, left] : {std::pair("odd' OR '1'='1", "10"), {"odd", "5"}}) {
        Conditions conds = host(name);
        EXPECT_EQ(SyslogDBDelete(path_, conds), 0);
        EXPECT_EQ(query("SELECT count(*) FROM logs"), Strings({left}));
    }
    EXPECT_EQ(SyslogDBDelete(path_, none_), 0);
    EXPECT_EQ(query("SELECT count(*) FROM logs"), Strings({"0"}));
}

}  // namespace
