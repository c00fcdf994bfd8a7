// What a session cannot show: a command that waits until it is interrupted.
#include "tests/support/child.h"

using namespace quor::test;

TEST(Follow, PrintsNewRowsUntilItIsInterrupted) {
    const TempFolder folder;
    const std::string out = folder.path("out");
    SqliteFile database(folder.path("log.db"));
    database.run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg);"
                 "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 12) "
                 "INSERT INTO logs(host, msg) SELECT 'new', 'old' FROM n");
    const auto appears = [&](const char* text) {
        return Eventually([&] { return ReadFile(out).find(text) != std::string::npos; });
    };
    for (const int ending : {SIGINT, SIGTERM}) {
        Child child(QUORLOG " search --follow --format json --host new,nas --db " + folder.path("log.db") + " >" + out);
        EXPECT_TRUE(appears("\"id\":12,"));
        database.run("INSERT INTO logs(host, msg) VALUES('new', 'first'), ('web', 'other')");
        EXPECT_TRUE(appears("first"));
        EXPECT_EQ(child.endOf(ending), 0);
        const std::string text = ReadFile(out);
        EXPECT_EQ(text.substr(0, 9), "[{\"id\":3,") << "the last ten";
        EXPECT_EQ(text.substr(text.size() - 3), "}]\n");
        EXPECT_EQ(text.find("other"), std::string::npos);
        database.run("DELETE FROM logs WHERE id > 12");
    }
}
