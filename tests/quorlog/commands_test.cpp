// The program itself over a real database.
#include <fcntl.h>

#include "program.h"

using namespace quor::test;

namespace {

// A log database with five rows; id 4 is missing.
class Commands : public Program {
  protected:
    Commands() {
        SqliteFile file(db_);
        file.run("CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, host, ip, fac, prio, llevel AS (prio), tag,"
                 " utcsec INTEGER, tzoffset, ldate, ltime, prog, msg)");
        file.run("INSERT INTO logs(id, host, ip, fac, prio, tag, utcsec, tzoffset, ldate, ltime, prog, msg) VALUES"
                 "(1,'web','10.0.0.1','auth','err','t',100,'+00:00','2026-01-01','10:00:00','sshd','login? yes'),"
                 "(2,'web','10.0.0.1','kern','info','t',200,'+00:00','2026-01-02','10:00:01','kernel','login, no'),"
                 "(3,'nas','10.0.0.2','kern','crit','t',300,'+00:00','2026-01-02','10:00:02','kernel','disk [sda]'),"
                 "(5,'nas','10.0.0.2','cron','debug','t',400,'+00:00','2026-01-03','10:00:03','cron','=it''s \"x\"'),"
                 "(6,'O''Neil','10.0.0.3','user','info','t',500,'+00:00','2026-01-04','10:00:04','app',"
                 "'a' || char(10) || char(27) || '[2J' || x'ff')");
        file.run("CREATE TABLE general_log(id INTEGER PRIMARY KEY, host, llevel, prog, ldate, ltime, luser,"
                 "msg); CREATE TABLE connection_log AS SELECT * FROM general_log;"
                 "CREATE TABLE transfer_log(id INTEGER PRIMARY KEY, host, prog, ldate, ltime, luser, event,"
                 "fname, isdir, fsize, ip)");
        file.run("INSERT INTO transfer_log(host, prog, ldate, ltime, luser, event, fname, isdir, fsize, ip) VALUES"
                 "('nas', 'smb', '2026-01-01', '10:00:00', 'ann', 'read', '/a', 0, '12', '10.0.0.9')");
        file.run("INSERT INTO general_log(host, llevel, prog, ldate, ltime, luser, msg) VALUES"
                 "('nas', 'warning', 'web', '2026-01-01', '10:00:00', 'ann', 'what?')");
    }

    std::string line(const std::string& arguments) const {
        const size_t verb = arguments.find("db ") == 0 ? arguments.find(' ', 3) : arguments.find(' ');
        const std::string db = " --db '" + db_ + "'";
        return arguments.substr(0, verb) + (arguments.find("--db") == std::string::npos ? db : "") +
               (verb == std::string::npos ? "" : arguments.substr(verb));
    }

    // On that database when the arguments name none.
    Outcome run(const std::string& arguments, const std::string& input = "") const {
        return Program::run(line(arguments), input);
    }

    // The ids that a search prints, in order.
    std::string ids(const std::string& arguments) const {
        const Outcome outcome = run("search --format csv " + arguments);
        std::string found;
        for (size_t at = outcome.out.find("\r\n"); at + 2 < outcome.out.size(); at = outcome.out.find("\r\n", at + 2)) {
            found += (found.empty() ? "" : " ") + outcome.out.substr(at + 2, outcome.out.find(',', at) - at - 2);
        }
        return outcome.status == 2 ? outcome.err : found;
    }

    std::string db_ = folder_.path("the log.db");
};

TEST_F(Commands, SearchFindsWhatTheFiltersAskFor) {
    const std::pair<const char*, const char*> cases[] = {
        {"", "6 5 3 2 1"},
        {"--limit 2 --offset 1", "5 3"},  // a page is full although an id is missing
        {"--limit 9 --offset 4", "1"},
        {"--before 5 --limit 2", "3 2"},
        {"--oldest --offset 2", "3 5 6"},
        {"--host \"O'Neil\" --host web", "6 2 1"},
        {"--level err+", "3 1"},
        {"--keyword '[sda]'", "3"},
        {"--keyword 'login?'", "1"},  // not "login,"
        {"--keyword 'login?' --offset 1", ""},
        {"--glob 'login?*'", "2 1"},
        {"--from 2026-01-02 --to 2026-01-03", "5 3 2"},
        {"--table transfer_log", "1"},
        {"--table general_log --level warning --keyword 'hat?'", "1"},
    };
    for (const auto& [arguments, expected] : cases) {
        EXPECT_EQ(ids(arguments), expected) << arguments;
    }
}

TEST_F(Commands, SearchStreamsMoreRowsThanOnePiece) {
    SqliteFile(db_).run("WITH RECURSIVE n(i) AS (SELECT 10 UNION ALL SELECT i + 1 FROM n WHERE i < 30000) "
                        "INSERT INTO logs(id, host, msg) SELECT i + (i > 20000) * 1000000000, 'bulk', 'm?' FROM n");
    EXPECT_EQ(run("count").out + run("count --estimate").out + run("count --keyword 'm?'").out,
              "29996\n1000030000\n29991\n");
    for (const char* order : {"", " --oldest"}) {
        const std::string rows = run(std::string("search --format ndjson") + order).out;
        EXPECT_EQ(std::count(rows.begin(), rows.end(), '\n'), 29996) << order;
    }
    EXPECT_EQ(ids("--keyword 'm?' --offset 29990"), "10");
    EXPECT_EQ(ids("--oldest --limit 2 --offset 19995"), "20000 1000020001");
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

TEST_F(Commands, SalvageReportsWhatItSaved) {
    std::string damaged = ReadFile(db_);
    damaged.replace(0, 100, 100, '\0');
    folder_.write("damaged.db", damaged);
    const Outcome outcome = run("db salvage damaged.db saved.db --format ndjson --db x");
    EXPECT_EQ(outcome.status, 2) << "it takes no --db";
    const std::string salvage = "cd '" + folder_.path() + "' && " QUORLOG " db salvage damaged.db saved.db";
    EXPECT_EQ(WEXITSTATUS(system((salvage + " --format ndjson >out 2>err").c_str())), 0) << ReadFile("err");
    EXPECT_NE(ReadFile(folder_.path("out")).find(R"("rows":7,)"), std::string::npos) << ReadFile(folder_.path("out"));
    EXPECT_EQ(SqliteFile(folder_.path("saved.db")).query("SELECT group_concat(id) FROM logs").at(0), "1,2,3,5,6");
    EXPECT_EQ(WEXITSTATUS(system((salvage + " >out 2>err").c_str())), 2) << "the new file exists";
}

TEST_F(Commands, NothingFoundNamesTheFilterThatExcludedEverything) {
    const std::pair<const char*, const char*> cases[] = {
        {"search --host web9,x --level err", "no row has --host web9,x"},
        {"search --from 2025-01-01 --to 2025-01-01", "no row is dated 2025-01-01"},
        {"search --host web --program cron", "no row matches all filters together"},
        {"search --keyword nowhere", "no message matches"},
        {"search --host web --offset 2", "--offset is beyond the last row"},
        {"search --before 1 --host web", "no row has an id below 1"},
        {"search --table connection_log --host x", "table connection_log is empty"},
    };
    for (const auto& [arguments, reason] : cases) {
        const Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.status, 1) << arguments;
        EXPECT_EQ(outcome.err, std::string("quorlog: nothing found: ") + reason + "\n");
    }
}

TEST_F(Commands, WrongUsageAndFailuresAreOneLineThatHelps) {
    folder_.write("text.db", std::string(5000, 'x'));
    SqliteFile(folder_.path("bare.db")).run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, prio, msg)");
    const std::pair<const char*, const char*> cases[] = {
        {"nosuch", "no such command 'nosuch'; see quorlog --help-all"},
        {"search --limit 99999999999999999999", "--limit"},
        {"search --table transfer_log --keyword x", "--keyword: table transfer_log has no column for it"},
        {"search --db missing.db", "missing.db; start syslog-ng, give another --db, or run quorlog db create"},
        {"search --db .", "is not a file"},
        {"search --db text.db", "run quorlog db check"},
        {"search --db bare.db --level err", "no such column: llevel; choose another --table or --db"},
        {"search >/dev/full", "No space left"},
        {"search >&-", "standard output is closed"},
        {"delete --yes", "--all"},
        {"delete --all --host web --yes", "--all"},
        {"delete --keyword 'a*' --yes", "--glob"},
        {"delete --host web", "--yes"},
        {"db create --db '$(id).db'", "cannot be used"},
        {"db create --db text.db", "exists already"},
    };
    for (const auto& [arguments, advice] : cases) {
        const Outcome outcome = run(arguments);
        EXPECT_EQ(outcome.status, 2) << arguments;
        EXPECT_NE(outcome.err.find(advice, outcome.err.find("quorlog: ")), std::string::npos) << outcome.err;
    }
    EXPECT_EQ(run("count").out, "5\n");
}

TEST_F(Commands, DeleteAsksAndDeletesWhatMatches) {
    const std::string info = run("db info --format json").out;
    EXPECT_NE(info.find("\"logs\":5"), std::string::npos) << info;
    EXPECT_NE(info.find("\"oldest\":\"1970-01-01\""), std::string::npos) << info;
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
    const pid_t child = fork();
    if (child == 0) {
        const int file = open(out.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
        dup2(file, STDOUT_FILENO);
        const std::string command =
            "exec " QUORLOG " " + line("search --follow --limit 1 --format json --host new,nas");
        execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
        _exit(127);
    }
    EXPECT_TRUE(appears("it's"));
    SqliteFile(db_).run("INSERT INTO logs(host, msg) VALUES('new', 'first'), ('web', 'other')");
    EXPECT_TRUE(appears("first"));
    kill(child, SIGINT);
    int status = 0;
    waitpid(child, &status, 0);
    EXPECT_TRUE(WIFEXITED(status) && WEXITSTATUS(status) == 0);
    const std::string text = ReadFile(out);
    EXPECT_EQ(text.substr(text.size() - 3), "}]\n");
    EXPECT_EQ(text.find("sda"), std::string::npos);
    EXPECT_EQ(text.find("other"), std::string::npos);
}

}  // namespace
