// The commands that report, and those that keep rules and databases in order.
#include "tests/quorlog/program.h"

using namespace quor::test;

namespace {

using Reports = Program;

TEST_F(Reports, StatisticsCountAndRate) {
    setenv("TZ", "UTC", 1);
    database("acc.db").run(
        "CREATE TABLE histogram(id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);"
        "CREATE TABLE eps(id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);"
        "INSERT INTO histogram VALUES(1, 'O''Neil', 7), (2, 'a', 5), (3, 'b', 9000000000), (4, 'c', 9);"
        "INSERT INTO eps VALUES(1, 1767225600, 'a', 6), (2, 1767225604, 'a', 1), "
        "(3, 1767225604, 'b', 2), (4, 1767312000, 'a', 1)");
    expect({
        {"stats total --db acc.db", 0, "count  9000000021\n"},
        {"stats device --db acc.db nobody", 1, "device  nobody\ncount   0\n", "no logs were counted"},
        {"stats top --limit 3 --db acc.db", 0,
         "     COUNT  DEVICE\n9000000000  b\n         9  c\n         7  O'Neil\n"},
        {"stats eps --from 2026-01-01 --to 2026-01-01 --format ndjson --db acc.db", 0,
         "{\"stamp\":1767225600,\"logs\":6,\"seconds\":null,\"per_second\":null}\n"
         "{\"stamp\":1767225604,\"logs\":3,\"seconds\":4,\"per_second\":0.75}\n"},
        {"stats eps --db acc.db --last 5s", 1, "", "no samples from"},
        {"stats eps --db acc.db --last 5w", 2, "", "give 90s, 10m, 6h or 2d"},
        {"stats total --db none.db", 2, "", "start quorlogd"},
    });
}

TEST_F(Reports, ValuesAndNamesOfALogDatabase) {
    database("log.db").run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, prog, tag, fac);"
                           "INSERT INTO logs(host) VALUES('b'), ('a' || char(10)), ('b')");
    database("old.db").run("CREATE TABLE db_info(id); CREATE TABLE hosts(host_id, host_name);"
                           "INSERT INTO hosts VALUES(3, 'x'), (7, 'y')");
    expect({
        {"values host --db log.db", 0, "a\\n\nb\n"},
        {"values 'host FROM logs;--' --db log.db", 2, "", "has no column"},
        {"names host --db log.db --format csv", 0, "key,name\r\n0,b\r\n1,\"a\n\"\r\n"},
        {"names host --db old.db --format csv", 0, "key,name\r\n3,x\r\n7,y\r\n"},
    });
}

TEST_F(Reports, EventsAreListedExportedAndCleared) {
    setenv("TZ", "UTC", 1);
    database("log.db").run(
        "CREATE TABLE log(id INTEGER PRIMARY KEY, level INTEGER, time INTEGER, user, event);"
        "INSERT INTO log VALUES(1, 0, 1767225600, 'SYSTEM', '<b>'), (2, 1, 1767225601, 'x&y', 'full')");
    database("it's.db").run("CREATE TABLE log(id INTEGER PRIMARY KEY, level INTEGER, time INTEGER, user, event)");
    expect({
        {"events list --limit 1 --db log.db", 0,
         "ID  TIME                 LEVEL    USER  EVENT\n 2  2026-01-01T00:00:01  Warning  x&y   full\n"},
        {"events list --offset 1 --format ndjson --db log.db", 0,
         "{\"id\":1,\"time\":1767225600,\"level\":\"Information\",\"user\":\"SYSTEM\",\"event\":\"<b>\"}\n"},
        {"events clear --db log.db", 2, "", "give --yes"},
        {"events clear --yes --db \"it's.db\"", 2, "", "apostrophe"},
        {"events html page --db \"it's.db\"", 1, "", "no events"},
    });
    EXPECT_EQ(run("events html page --safe --db log.db").status, 0);
    const std::string page = ReadFile(folder_.path("page"));
    EXPECT_NE(page.find("<td>&lt;b&gt;</td>"), std::string::npos);
    EXPECT_EQ(run("events clear --db log.db", "y\n").status, 0);
    EXPECT_FALSE(exists("log.db"));
}

TEST_F(Reports, RulesAreSetListedAndTested) {
    const std::string rules = quor::paths::kNotifyRules;
    WriteFile(rules, "");
    std::filesystem::remove(rules);
    expect({
        {"rules list", 1, "", "no rules are set"},
        {"rules set worst --level crit", 0, "set rule worst: severity crit\n"},
        {"rules set many --eps 50", 0, "set rule many: eps 50\n"},
        {"rules set word --keyword 'a \"b\" 100%'", 0, "set rule word: keyword a \"b\" 100%\n"},
        {"rules set many --disable", 0, "set rule many: eps 50, disabled\n"},
        {"rules set 'x]' --eps 1", 2, "", "cannot be used"},
        {"rules set 'x\ty' --eps 1", 2, "", "the name 'x\\ty' cannot be used"},
        {"rules set x --keyword 'a\nb=\"c\"'", 2, "", "line breaks"},
        {"rules list --format csv", 0,
         "name,type,threshold,enabled\r\nworst,severity,crit,yes\r\nmany,eps,50,no\r\n"
         "word,keyword,\"a \"\"b\"\" 100%\",yes\r\n"},
        {"rules test --level alert --eps 99 --format csv", 0,
         "type,given,notifies,keyword\r\nseverity,alert,yes,\r\neps,99,no,\r\n"},
        {"rules test --message 'so a \"b\" 100% x' --format csv --safe-csv", 0,
         "type,given,notifies,keyword\r\nkeyword,\"so a \"\"b\"\" 100% x\",yes,\"a \"\"b\"\" 100%\"\r\n"},
    });
    const std::string all = ReadFile(rules);
    WriteFile(rules, all.substr(0, all.find("[many")) + "[half]\nnotify_type=\"1\"\n");
    expect({{"rules list", 2, "NAME   TYPE      THRESHOLD  ENABLED\nworst  severity  crit       yes\n", "'half'"}});
    std::filesystem::remove(rules);
}

TEST_F(Reports, DatabasesAreCheckedSwitchedAndLimited) {
    database("a b.db").run("CREATE TABLE logs(id INTEGER PRIMARY KEY, msg);"
                           "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 3000) "
                           "INSERT INTO logs(msg) SELECT 'some message of some length' FROM n");
    const auto status = [&](const std::string& arguments) { return run(arguments + " --db log.db").status; };
    std::filesystem::copy(folder_.path("a b.db"), folder_.path("log.db"));
    EXPECT_EQ(status("db wal"), 0);
    EXPECT_EQ(database("log.db").query("PRAGMA journal_mode"), std::vector<std::string>{"wal"});
    EXPECT_EQ(status("db limit 10"), 2);
    EXPECT_TRUE(exists("log.db"));
    EXPECT_EQ(status("db limit 10 --yes"), 0);
    EXPECT_FALSE(exists("log.db"));
    std::string damaged = ReadFile(folder_.path("a b.db"));
    std::fill(damaged.begin() + 8192, damaged.begin() + 12288, 'x');
    folder_.write("bad.db", damaged);
    SqliteFile lock = database("db check.db");
    lock.run("CREATE TABLE logs(id); BEGIN EXCLUSIVE");
    expect({
        {"db check --db bad.db", 2, "", "bad.db is damaged; stop syslog-ng"},
        {"db check --db 'db check.db'", 2, "", "db check.db: database is locked; another program is using it"},
    });
}

TEST_F(Reports, EntriesAreParsedAndBadLinesNamed) {
    const Outcome outcome =
        run("parse --format csv", "too short\nkern odd 2026-01-01 10:00:00 x 8 +00:00 h ip p t  m\n");
    EXPECT_EQ(outcome.out, "id,ldate,ltime,utcsec,tzoffset,host,ip,fac,prio,tag,prog,msg\r\n"
                           "0,2026-01-01,10:00:00,0,+00:00,h,ip,kern,debug,t,p,\" m\"\r\n");
    EXPECT_EQ(outcome.status, 2);
    EXPECT_EQ(outcome.err, "quorlog: line 1: fewer than twelve fields\n"
                           "quorlog: 1 of 2 lines were not entries; check the template that writes them\n");
}

}  // namespace
