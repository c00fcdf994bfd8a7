// The program itself over a real database.
#include "tests/quorlog/program.h"
#include "tests/support/child.h"

using namespace quor::test;

namespace {

constexpr char kDb[] = " --db 'the log.db' ";

// A log database with five rows; id 4 is missing.
class Commands : public Program {
  protected:
    Commands() {
        database("the log.db")
            .run("CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, host, ip, fac, prio, llevel AS (prio), tag,"
                 " utcsec INTEGER, tzoffset, ldate, ltime, prog, msg);"
                 "INSERT INTO logs(id, host, ip, fac, prio, tag, utcsec, tzoffset, ldate, ltime, prog, msg) VALUES"
                 "(1,'web','10.0.0.1','auth','err','t',100,'+00:00','2026-01-01','10:00:00','sshd','login? yes'),"
                 "(2,'web','10.0.0.1','kern','info','t',200,'+00:00','2026-01-02','10:00:01','kernel','login, no'),"
                 "(3,'nas','10.0.0.2','kern','emerg','t',300,'+00:00','2026-01-02','10:00:02','kernel','disk [sda]'),"
                 "(5,'nas','10.0.0.2','cron','debug','t',400,'+00:00','2026-01-03','10:00:03','cron','=it''s \"x\"'),"
                 "(6,'O''Neil','10.0.0.3','user','info','t',500,'+00:00','2026-01-04','10:00:04','app',"
                 "'a' || char(10) || char(27) || '[2J' || x'ff');"
                 "CREATE TABLE general_log(id INTEGER PRIMARY KEY, host, llevel, prog, ldate, ltime, luser, msg);"
                 "INSERT INTO general_log(host, llevel, prog, ldate, ltime, luser, msg) VALUES"
                 "('nas', 'warning', 'web', '2026-01-01', '10:00:00', 'ann', 'what?')");
    }

    // On that database.
    Outcome run(const std::string& arguments, const std::string& input = "") const {
        return Program::run(arguments + kDb, input);
    }

    // The ids that a search prints, in order.
    std::string ids(const std::string& arguments) const {
        return run("search --format ndjson " + arguments + kDb +
                   R"( | sed -E 's/.{6}([0-9]+).*/\1/' | paste -sd ' ' | tr -d '\n'; true)")
            .out;
    }
};

TEST_F(Commands, SearchFindsWhatTheFiltersAskFor) {
    const std::pair<const char*, const char*> cases[] = {
        {"", "6 5 3 2 1"},
        {"--limit 2 --offset 1", "5 3"},  // a page is full although an id is missing
        {"--before 5 --limit 2", "3 2"},
        {"--oldest --offset 2", "3 5 6"},
        {"--level err+,debug", "5 3 1"},
        {"--facility kern --program kernel,sshd", "3 2"},
        {"--keyword 'login?'", "1"},  // not "login,"
        {"--keyword 'login?' --offset 1", ""},
        {"--glob 'login?*'", "2 1"},
        {"--from 2026-01-02 --to 2026-01-03", "5 3 2"},
        {"--table general_log --level warning --keyword 'hat?'", "1"},
    };
    for (const auto& [arguments, expected] : cases) {
        EXPECT_EQ(ids(arguments), expected) << arguments;
    }
}

TEST_F(Commands, SearchStreamsMoreRowsThanOnePiece) {
    database("the log.db")
        .run("WITH RECURSIVE n(i) AS (SELECT 10 UNION ALL SELECT i + 1 FROM n WHERE i < 30000) "
             "INSERT INTO logs(id, host, msg) SELECT i + (i > 20000) * 1000000000, 'bulk', 'm?' FROM n");
    EXPECT_EQ(run("count").out + run("count --estimate").out + run("count --keyword 'm?'").out,
              "29996\n1000030000\n29991\n");
    const std::string rows = run("search --format ndjson").out;
    EXPECT_EQ(std::count(rows.begin(), rows.end(), '\n'), 29996);
    EXPECT_EQ(ids("--keyword 'm?' --offset 29990"), "10");
    EXPECT_EQ(ids("--oldest --limit 2 --offset 19995"), "20000 1000020001");
    expect({{"search >/dev/full", 2, "", "No space left"}}, kDb);
}

TEST_F(Commands, SearchShowsHostileTextHarmlessly) {
    EXPECT_EQ(run("search --limit 1 --format ndjson").out,
              R"({"id":6,"ldate":"2026-01-04","ltime":"10:00:04","utcsec":500,"tzoffset":"+00:00","host":"O'Neil",)"
              R"("ip":"10.0.0.3","fac":"user","prio":"info","tag":"t","prog":"app","msg":"a\n\u001b[2J\\xff"})"
              "\n");
    EXPECT_EQ(run("search --limit 1").out, "ID  LDATE       LTIME     HOST    FAC   PRIO  PROG  MSG\n"
                                           " 6  2026-01-04  10:00:04  O'Neil  user  info  app   a\\n\\x1b[2J\\xff\n");
    EXPECT_NE(run("search --program cron --format csv --safe-csv").out.find(R"(cron,"'=it's ""x""")"),
              std::string::npos);
}

TEST_F(Commands, NothingFoundNamesTheFilterThatExcludedEverything) {
    expect(
        {
            {"search --host web9,x --level err", 1, "", "quorlog: nothing found: no row has --host web9,x\n"},
            {"search --from 2025-01-01 --to 2025-01-01", 1, "", "nothing found: no row is dated 2025-01-01\n"},
            {"search --host web --program cron", 1, "", "nothing found: no row matches all filters together\n"},
            {"search --host web --offset 2", 1, "", "nothing found: --offset is beyond the last row\n"},
        },
        kDb);
}

TEST_F(Commands, WrongUsageAndFailuresAreOneLineThatHelps) {
    folder_.write("text.db", std::string(5000, 'x'));
    database("bare.db").run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, prio, msg)");
    expect(
        {
            {"nosuch --db x", 2, "", "no such command 'nosuch'; see quorlog --help-all"},
            {"search --table transfer_log --keyword x", 2, "", "--keyword: table transfer_log has no column for it"},
            {"search --host a --host ''", 2, "", "empty name in 'a,'"},
            {"search --program a,any", 2, "", "'any' means every name"},
            {"search --level warn", 2, "", "no such level 'warn'"},
            {"search --from 2026-02-02 --to 2026-02-01", 2, "", "--from 2026-02-02 is after --to 2026-02-01"},
            {"search --glob $(printf '%15001s' | tr ' ' '[')", 2, "", "too long"},
            {"search --db missing.db", 2, "",
             "missing.db; start syslog-ng, give another --db, or run quorlog db create"},
            {"search --db text.db", 2, "", "run quorlog db check"},
            {"search --db bare.db --level err", 2, "", "no such column: llevel; choose another --table or --db"},
            {"delete --all --host web --yes", 2, "", "--all"},
            {"delete --keyword 'a*' --yes", 2, "", "--glob"},
            {"delete --host web", 2, "", "--yes"},
            {"db create --db '$(id).db'", 2, "", "cannot be used"},
        },
        kDb);
    EXPECT_EQ(run("count").out, "5\n");
}

TEST_F(Commands, DeleteAsksAndDeletesWhatMatches) {
    const std::string info = run("db info --format json").out;
    EXPECT_NE(info.find("\"logs\":5"), std::string::npos) << info;
    EXPECT_EQ(run("delete --host web", "n\n").status, 1);
    EXPECT_EQ(run("count").out, "5\n");
    EXPECT_EQ(run("delete --host web", "y\n").out, "deleted 2 rows\n");
    EXPECT_EQ(ids(""), "6 5 3");
    EXPECT_EQ(run("delete --all --yes").status, 0);
    EXPECT_EQ(run("count").status, 1);
    EXPECT_EQ(run("db checkpoint").status, 0);
}

TEST_F(Commands, FollowPrintsNewRowsUntilItIsInterrupted) {
    const std::string out = folder_.path("out");
    const auto appears = [&](const char* text) {
        return Eventually([&] { return ReadFile(out).find(text) != std::string::npos; });
    };
    Child child(QUORLOG " search --follow --limit 1 --format json --host new,nas --db '" + folder_.path("the log.db") +
                "' >" + out);
    EXPECT_TRUE(appears("it's"));
    database("the log.db").run("INSERT INTO logs(host, msg) VALUES('new', 'first'), ('web', 'other')");
    EXPECT_TRUE(appears("first"));
    EXPECT_EQ(child.endOf(SIGINT), 0);
    const std::string text = ReadFile(out);
    EXPECT_EQ(text.substr(text.size() - 3), "}]\n");
    EXPECT_EQ(text.find("sda"), std::string::npos);
    EXPECT_EQ(text.find("other"), std::string::npos);
}

}  // namespace
