#include "dbutil.h"
#include "support/db_spy.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

// Counts down from `context` rows and then stops the walk; collects ids.
struct Walk {
    Strings ids;
    size_t most = 1000;

    static int take(_SYSLOG_LOG_DATA_tag& record, void* context) {
        auto& walk = *static_cast<Walk*>(context);
        walk.ids.push_back(std::to_string(record.id));
        return walk.ids.size() >= walk.most ? 1 : 0;
    }
};

// Ids 1 to 10; odd ones are of host "odd".
class Select : public testing::Test {
  protected:
    Select() {
        SqliteFile(path_).run(
            "CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg);"
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i+1 FROM n WHERE i < 10)"
            "INSERT INTO logs SELECT i, iif(i % 2, 'odd', 'even'), 'm' || i FROM n;"
            "CREATE TABLE general_log(id INTEGER PRIMARY KEY, host); INSERT INTO general_log VALUES(5, 'g');"
            "CREATE TABLE other(id INTEGER PRIMARY KEY); INSERT INTO other VALUES(1)");
        SpyOnDb() = {};
        TakeSystemLog();
    }

    static std::list<_SYSLOG_SQL_COND_tag> host(const char* name) { return {{SYSLOG_ATTRI_HOST, 0, name, {}}}; }

    const TempFolder folder_;
    std::string path_ = folder_.path("log.db");
    std::list<_SYSLOG_SQL_COND_tag> none_;
    std::list<_SYSLOG_SQL_COND_tag> all_{{SYSLOG_ATTRI_MSG, 8, "**", {}}};
    _SYSLOG_SQL_ORDER_tag newest_{0, SYSLOG_ATTRI_ID};
    Walk walk_;
};

TEST_F(Select, PagesUnfilteredTablesByIdWindow) {
    _SYSLOG_SQL_LIMIT_tag page{3, 2};
    ASSERT_EQ(SyslogDBSelect(path_, none_, &page, &newest_, Walk::take, &walk_, false), 0);
    ASSERT_EQ(SyslogDBSelect(path_, all_, &page, &newest_, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids, Strings({"8", "7", "6", "8", "7", "6"}));
    EXPECT_EQ(
        SpyOnDb().statements,
        Strings({"SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE ( id > totalCount - 5 AND id "
                 "<= totalCount - 2) ORDER BY id desc",
                 "SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE (msg GLOB '**') AND ( id > "
                 "totalCount - 5 AND id <= totalCount - 2) ORDER BY id desc"}));
}

TEST_F(Select, PagesFilteredTablesThroughTheLimitedSelect) {
    auto conds = host("odd");
    _SYSLOG_SQL_LIMIT_tag page{(1ULL << 32) + 2, (1ULL << 33) + 1};
    ASSERT_EQ(SyslogDBSelect(path_, conds, &page, &newest_, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids, Strings({"7", "5"}));
    EXPECT_EQ(SpyOnDb().statements, Strings({"SELECT * FROM logs WHERE (host = 'odd') ORDER BY id desc [2,1]"}));
}

TEST_F(Select, WithoutAWindowGivesEveryRowThatIsTaken) {
    _SYSLOG_SQL_LIMIT_tag everything{0, 4};
    _SYSLOG_SQL_ORDER_tag oldest{7, SYSLOG_ATTRI_HOST};
    ASSERT_EQ(SyslogDBSelect(path_, none_, &everything, &oldest, Walk::take, &walk_, false), 0);
    ASSERT_EQ(SyslogDBSelect(path_, none_, nullptr, nullptr, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids.size(), 20U);
    EXPECT_EQ(SpyOnDb().statements, Strings({"SELECT * FROM logs ORDER BY host asc", "SELECT * FROM logs"}));
    EXPECT_EQ(SyslogDBSelect(path_, none_, nullptr, nullptr, nullptr, nullptr, false), 0);
    std::string other = "other";
    EXPECT_EQ(SyslogDBSelectByTable(path_, other, none_, nullptr, nullptr, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids.size(), 20U) << "a row of an unknown table was handed over";
    walk_.most = 21;
    EXPECT_EQ(SyslogDBSelect(path_, none_, nullptr, &newest_, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids.back(), "10") << "the walk ends when it is asked to";
}

TEST_F(Select, ReportsWhatFailed) {
    std::string relative = "log.db";
    std::string missing = folder_.path("none.db");
    std::string table = "nowhere";
    EXPECT_EQ(SyslogDBSelect(relative, none_, nullptr, nullptr, nullptr, nullptr, false), -1);
    EXPECT_EQ(SyslogDBSelectCount(relative, none_, nullptr, nullptr), -1);
    EXPECT_EQ(SyslogDBDelete(relative, none_), -1);
    EXPECT_TRUE(SpyOnDb().statements.empty());
    EXPECT_EQ(SyslogDBSelect(missing, none_, nullptr, nullptr, nullptr, nullptr, false), -1);
    EXPECT_EQ(SyslogDBSelectByTable(path_, table, none_, nullptr, nullptr, nullptr, nullptr, false), -1);
    EXPECT_EQ(SyslogDBSelectCount(missing, none_, nullptr, nullptr), -1);
    EXPECT_EQ(SyslogDBDelete(missing, none_), -1);
    EXPECT_EQ(TakeSystemLogTexts(),
              Strings({"dbutil:464 Invalid syslog db path!", "dbutil:573 Invalid syslog db path!",
                       "dbutil:653 Invalid syslog db path!", "fail to connect database (" + missing + ")",
                       "fail to execute database command (SELECT * FROM nowhere)"}));
    EXPECT_FALSE(std::filesystem::exists(missing));
}

TEST_F(Select, CountsByLargestIdUnlessFiltered) {
    SqliteFile(path_).run("DELETE FROM logs WHERE id IN (3, 4, 5)");
    auto odd = host("odd");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, all_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, odd, nullptr, &newest_), 3);
    EXPECT_EQ(SpyOnDb().statements,
              Strings({"SELECT max(rowid) FROM logs", "SELECT max(rowid) FROM logs WHERE (msg GLOB '**')",
                       "SELECT COUNT(*) FROM logs WHERE (host = 'odd') ORDER BY id desc"}));

    _SYSLOG_SQL_LIMIT_tag beyond{1, 1};
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, &beyond, nullptr), -1) << "the only row was skipped";
    SqliteFile(path_).run("UPDATE logs SET id = 5000000000 WHERE id = 10");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), 705032704) << "not the low 32 bits";

    std::string twoRows = "logs GROUP BY host";
    EXPECT_EQ(SyslogDBSelectCountByTable(path_, twoRows, none_, nullptr, nullptr), -2);
}

TEST_F(Select, DeletesOnlyWhatMatches) {
    auto hostile = host("odd' OR '1'='1");
    auto odd = host("odd");
    std::string table = "logs; DELETE FROM logs; --";
    EXPECT_EQ(SyslogDBDelete(path_, hostile), 0);
    EXPECT_EQ(SyslogDBSelectByTable(path_, table, none_, nullptr, nullptr, Walk::take, &walk_, false), -1);
    EXPECT_EQ(SyslogDBSelectCountByTable(path_, table, none_, nullptr, nullptr), -1);
    EXPECT_EQ(SqliteFile(path_).query("SELECT count(*) FROM logs"), Strings({"10"}));
    EXPECT_EQ(SyslogDBDelete(path_, odd), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT DISTINCT host FROM logs"), Strings({"even"}));
    EXPECT_EQ(SyslogDBDelete(path_, none_), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT count(*) FROM logs"), Strings({"0"}));
}

}  // namespace
