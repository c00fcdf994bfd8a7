// quorlogd as a process: fed, signalled and read like the real one.
#include <chrono>
#include <random>

#include "dbutil.h"
#include "tests/support/child.h"

using namespace quor::test;
namespace paths = quor::paths;

namespace {

class Quorlogd : public Child {
  public:
    // `options` as a shell reads them.
    explicit Quorlogd(const std::string& options = "") : Child(QUORLOGD " --stderr " + options + " >/dev/null") {}

    bool started() const { return says("Started: "); }  // and answers signals
    bool takes(int lines) const { return says("Statistics: " + std::to_string(lines) + " lines", SIGUSR1); }
};

std::string entry(const std::string& host, const std::string& message) {
    return "local0 info 2026-11-21 05:15:54 1795238154 7 +00:00 " + host + " 10.0.0.1 kernel 84 " + message + "\n";
}

std::string entries(const std::string& host, int count) {
    std::string text;
    while (count-- > 0) {
        text += entry(host, "link is up");
    }
    return text;
}

std::string keywordRule(const std::string& keyword) {
    return "[rule]\nnotify_type=\"2\"\nnotify_pri=\"0\"\nnotify_eps=\"0\"\nnotify_pat=\"" + keyword +
           "\"\nnotify_enable=\"1\"\n";
}

unsigned long long countOf(const std::string& device) {
    std::string path = paths::kAccountingDb;
    return SyslogDBHistGetSingle(path, device);
}

Strings events() {
    SqliteFile file(paths::kEventDb);
    const bool created = !file.query("SELECT 1 FROM sqlite_master WHERE name = 'log'").empty();
    return created ? file.query("SELECT event FROM log ORDER BY id") : Strings();
}

class QuorlogdProcess : public testing::Test {
  protected:
    void SetUp() override {
        for (const char* path : {paths::kAccountingDb, paths::kEventDb}) {
            std::filesystem::remove_all(std::filesystem::path(path).parent_path());
            std::filesystem::create_directories(std::filesystem::path(path).parent_path());
        }
        WriteFile(paths::kNotifyRules, "");
        std::filesystem::remove(paths::kNotifyFilter);
    }

    // Until the database holds what a write that is asked for leaves there.
    static bool writes(Quorlogd& daemon, const std::string& device, unsigned long long count) {
        return Eventually([&] {
            daemon.signal(SIGUSR2);
            return countOf(device) == count;
        });
    }
};

// Also with databases that a full volume left empty.
TEST_F(QuorlogdProcess, AccountsTheInputUpToItsEnd) {
    WriteFile(paths::kEventDb, "");
    WriteFile(paths::kAccountingDb, "");
    Quorlogd daemon("--max-line 1024");
    const std::string text = entry("router1", "it's up") + "not an entry\n\n" + entry("router2", "") +
                             entry("router1", std::string(1 << 20, 'x')) + entry("router1", "the last, without an end");
    for (const char c : text.substr(0, 300)) {
        daemon.send({&c, 1});
    }
    daemon.send(std::string_view(text).substr(300, text.size() - 301));
    EXPECT_EQ(daemon.endOfInput(), 0);
    EXPECT_EQ(countOf("router1"), 3U);
    EXPECT_TRUE(daemon.says("5 lines, 1 bad, 1 oversized, 2 devices, 0 notices,")) << daemon.messages();
    EXPECT_EQ(events().size(), 2U);
    EXPECT_EQ(SqliteFile(paths::kAccountingDb).query("SELECT sum(eps) FROM eps"), Strings{"4"});
}

TEST_F(QuorlogdProcess, AnswersSignals) {
    for (const int last : {SIGTERM, SIGINT}) {
        Quorlogd daemon;
        ASSERT_TRUE(daemon.started());
        daemon.send(entries("router1", 5));
        EXPECT_TRUE(daemon.takes(5)) << daemon.messages();
        daemon.send(entries("router1", 2));
        EXPECT_EQ(daemon.endOf(last), 0);
        EXPECT_EQ(countOf("router1"), last == SIGTERM ? 7U : 14U);  // the second reads back what the first wrote
    }
}

TEST_F(QuorlogdProcess, FollowsItsRulesAfterHup) {
    const std::string spool = paths::kNotifySpool + std::string("/desktop.jsonl");
    std::filesystem::remove(spool);
    WriteFile(paths::kSystemSettings, "desktop_notify_enabled=\"yes\"\n");
    Quorlogd daemon("--max-notices 2");
    ASSERT_TRUE(daemon.started());
    WriteFile(paths::kNotifyRules, keywordRule("it's"));
    daemon.signal(SIGHUP);
    daemon.send(entry("router1", "it's down") + entry("router2", "it is not") + entry("router2", "it's < down") +
                entry("router3", "it's too much"));
    EXPECT_EQ(daemon.endOfInput(), 0);
    EXPECT_TRUE(daemon.says("2 notices, 1 notices suppressed")) << daemon.messages();
    ASSERT_EQ(events().size(), 4U);
    EXPECT_EQ(events()[2], "Event detection: Received log which contains [it's]. Log content: [it's \u2039 down]");
    EXPECT_TRUE(Eventually([&spool] { return ReadFile(spool).find("it's < down") != std::string::npos; }));
    std::filesystem::remove(paths::kSystemSettings);
}

TEST_F(QuorlogdProcess, KeepsWhatADatabaseDoesNotTake) {
    SqliteFile(paths::kAccountingDb).run(ReadFile(paths::kAccountingSchema));
    Quorlogd daemon;
    ASSERT_TRUE(daemon.started());
    daemon.send(entries("router1", 3));
    ASSERT_TRUE(writes(daemon, "router1", 3));
    {
        SqliteFile locked(paths::kAccountingDb);
        locked.run("BEGIN EXCLUSIVE");
        daemon.send(entries("router1", 4));
        // There is nothing to write before the second has passed.
        EXPECT_TRUE(daemon.says("Accounting is kept in memory", SIGUSR2)) << daemon.messages();
    }
    EXPECT_TRUE(writes(daemon, "router1", 7));
    EXPECT_EQ(SqliteFile(paths::kAccountingDb).query("SELECT sum(eps) FROM eps"), Strings{"7"});
}

TEST_F(QuorlogdProcess, LeavesSoundDatabasesWhenKilled) {
    std::random_device random;
    WriteFile(paths::kNotifyRules, keywordRule("up"));
    for (int i = 0; i < 5; ++i) {
        Quorlogd daemon("--max-notices 10");
        ASSERT_TRUE(daemon.started());
        const auto end = std::chrono::steady_clock::now() + std::chrono::microseconds(random() % 300000);
        while (std::chrono::steady_clock::now() < end) {
            daemon.send(entries("router" + std::to_string(random() % 100), 20));
            daemon.signal(SIGUSR2);
        }
        EXPECT_EQ(daemon.endOf(SIGKILL), -1);
        for (const char* path : {paths::kAccountingDb, paths::kEventDb}) {
            EXPECT_TRUE(!std::filesystem::exists(path) ||
                        SqliteFile(path).query("PRAGMA integrity_check") == Strings{"ok"})
                << path;
        }
    }
    const unsigned long long before = countOf("last");
    Quorlogd daemon;
    daemon.send(entries("last", 3));
    EXPECT_EQ(daemon.endOfInput(), 0);
    EXPECT_EQ(countOf("last"), before + 3);
}

TEST_F(QuorlogdProcess, RaisesAFullVolumeOnce) {
    Quorlogd daemon("--volume / --volume-full 0.000001 --check-interval 1");
    EXPECT_TRUE(Eventually([] { return std::filesystem::exists(paths::kEventDb) && events().size() >= 2; }));
    daemon.send("not an entry\n");
    EXPECT_TRUE(daemon.says("1 lines were not log entries")) << "no other check";
    EXPECT_EQ(daemon.endOfInput(), 0);
    EXPECT_EQ(events().size(), 3U);
    EXPECT_EQ(events()[1], "Volume space is not enough.");
}

}  // namespace
