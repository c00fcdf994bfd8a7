// What a session cannot show: commands that wait.
#include "tests/support/child.h"

using namespace quor::test;

namespace {

class Commands : public testing::Test {
  protected:
    Commands() { database_.run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg); BEGIN; ROLLBACK"); }

    std::string command(const std::string& arguments) const {
        return QUORLOG " " + arguments + " --db '" + path_ + "'";
    }

    const TempFolder folder_;
    const std::string path_ = folder_.path("db check.db");
    SqliteFile database_{path_};
};

TEST_F(Commands, FollowPrintsNewRowsUntilItIsInterrupted) {
    database_.run("WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 12) "
                  "INSERT INTO logs(host, msg) SELECT 'new', 'old' FROM n");
    const std::string out = folder_.path("out");
    const auto appears = [&](const char* text) {
        return Eventually([&] { return ReadFile(out).find(text) != std::string::npos; });
    };
    for (const int ending : {SIGINT, SIGTERM}) {
        Child child(command("search --follow --format json --host new,nas >" + out));
        EXPECT_TRUE(appears("\"id\":12,"));
        database_.run("INSERT INTO logs(host, msg) VALUES('new', 'first'), ('web', 'other')");
        EXPECT_TRUE(appears("first"));
        EXPECT_EQ(child.endOf(ending), 0);
        const std::string text = ReadFile(out);
        EXPECT_EQ(text.substr(0, 9), "[{\"id\":3,") << "the last ten";
        EXPECT_EQ(text.substr(text.size() - 3), "}]\n");
        EXPECT_EQ(text.find("other"), std::string::npos);
        database_.run("DELETE FROM logs WHERE id > 12");
    }
}

TEST_F(Commands, FollowEndsWhenItsReaderHasGone) {
    database_.run("INSERT INTO logs(msg) VALUES('a'), ('b')");
    FILE* reader =
        popen((command("search --follow --limit 1 --format ndjson") + " 2>" + folder_.path("err")).c_str(), "r");
    char line[8] = "";
    EXPECT_STREQ(fgets(line, sizeof line, reader), "{\"id\":2");
    EXPECT_EQ(WEXITSTATUS(pclose(reader)), 2);
    EXPECT_EQ(ReadFile(folder_.path("err")), "quorlog: cannot write the output: its reader has gone\n");
}

TEST_F(Commands, ALockedDatabaseIsNotCalledDamagedWhateverItsName) {
    database_.run("BEGIN EXCLUSIVE");
    Child child(command("db check"));
    EXPECT_EQ(child.endOfInput(), 2);
    EXPECT_EQ(child.messages(), "quorlog: " + path_ + ": database is locked; another program is using it; try again\n");
}

}  // namespace
