// The log schema against SQLite's planner: a search that stops using an index takes a hundred times longer.
#include <algorithm>

#include "tests/support/testing.h"

using namespace quor::test;

namespace {

TEST(LogSchema, SearchesGoTheWayThatWasMeasured) {
    const TempFolder folder;
    SqliteFile(folder.path("logs.db")).run(ReadFile(QUOR_SOURCE "/schema/syslog.sql"));
    SqliteFile reader(folder.path("logs.db"));  // reads the statistics that the schema left
    const std::pair<const char*, const char*> cases[] = {
        {"SELECT * FROM logs WHERE (host = 'a') ORDER BY id desc LIMIT 50",
         "SEARCH logs USING INDEX logs_host_idx (host=?)"},
        {"SELECT * FROM logs WHERE (prog = 'a') AND (msg GLOB '*b*') ORDER BY id desc LIMIT 50",
         "SEARCH logs USING INDEX logs_prog_idx (prog=?)"},
        {"SELECT * FROM logs WHERE ((host = 'a') OR (host = 'b')) ORDER BY id desc LIMIT 50", "SCAN logs"},
        {"SELECT * FROM logs WHERE (ldate >= '2024-01-01') ORDER BY id desc LIMIT 50", "SCAN logs"},
        {"SELECT COUNT(*) FROM logs WHERE (host = 'a')", "SEARCH logs USING COVERING INDEX logs_host_idx (host=?)"},
        {"SELECT prog FROM logs GROUP BY prog ORDER BY prog asc", "SCAN logs USING COVERING INDEX logs_prog_idx"},
    };
    for (const auto& [sql, plan] : cases) {
        EXPECT_EQ(reader.query(std::string("EXPLAIN QUERY PLAN ") + sql).at(3), plan) << sql;
    }
    const auto code = reader.query("EXPLAIN SELECT DISTINCT host FROM logs");  // skips from one host to the next
    EXPECT_NE(std::find(code.begin(), code.end(), "SeekGT"), code.end());

    reader.run("INSERT INTO logs (host, prio, prog) VALUES ('b', 'err', 'su'), ('a', 'info', 'su')");
    EXPECT_EQ(reader.query("SELECT id FROM logs WHERE llevel = 'err'"), Strings{"1"});
    EXPECT_EQ(reader.query("SELECT host_name FROM hosts ORDER BY 1"), (Strings{"a", "b"}));
}

}  // namespace
