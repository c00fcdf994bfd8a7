// quorlogd as a process: it follows a database that is written, replaced and locked, and is signalled and killed.
#include <arpa/inet.h>
#include <sys/socket.h>

#include <chrono>
#include <random>

#include "base/guards.h"
#include "dbutil.h"
#include "tests/support/child.h"

using namespace quor::test;
namespace paths = quor::paths;
using quor::Descriptor;

namespace {

class Quorlogd : public Child {
  public:
    // `options` as a shell reads them.
    explicit Quorlogd(const std::string& options = "")
        : Child(QUORLOGD " --stderr --flush-interval 1 " + options + " >/dev/null") {}

    bool started() const { return says("Started: "); }  // and answers signals
};

std::string keywordRule(const std::string& keyword) {
    return "[rule]\nnotify_type=\"2\"\nnotify_pri=\"0\"\nnotify_eps=\"0\"\nnotify_pat=\"" + keyword +
           "\"\nnotify_enable=\"1\"\n";
}

void createLogs() {
    SqliteFile(paths::kWorkingDb).run("PRAGMA journal_mode=WAL; " + ReadFile(paths::kLogSchema));
}

// `count` rows of a second each, from two devices.
void store(int count, const std::string& message = "link is up", const std::string& host = "router") {
    SqliteFile(paths::kWorkingDb)
        .run("WITH n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < " + std::to_string(count) +
             ") INSERT INTO logs(msg, prio, host, ip, prog, pid, ldate, ltime, rsec) SELECT '" + message +
             "', 'info', '" + host +
             "' || (i % 2), '10.0.0.1', 'kernel', '7', '2026-11-21', '05:15:54', "
             "1795238154 + i / 100 FROM n");
}

// Nothing where there is no such database or table yet.
Strings number(const std::string& path, const std::string& sql) try {
    return std::filesystem::exists(path) ? SqliteFile(path).query(sql) : Strings();
} catch (const std::runtime_error&) {
    return {};
}

// The rows that are stored, counted by device, and in the samples.
Strings totals() {
    Strings all = number(paths::kWorkingDb, "SELECT count(*) FROM logs");
    for (const char* sql : {"SELECT sum(count) FROM histogram", "SELECT sum(eps) FROM eps"}) {
        const Strings found = number(paths::kAccountingDb, sql);
        all.insert(all.end(), found.begin(), found.end());
    }
    return all;
}

bool counts(int rows) {
    const std::string expected = std::to_string(rows);
    return Eventually([&] { return totals() == Strings(3, expected); });
}

Strings events() {
    return number(paths::kEventDb, "SELECT event FROM log WHERE event NOT LIKE 'Server was %' ORDER BY id");
}

class QuorlogdProcess : public testing::Test {
  protected:
    void SetUp() override {
        for (const char* path : {paths::kAccountingDb, paths::kEventDb, paths::kReceiverPid}) {
            std::filesystem::remove_all(std::filesystem::path(path).parent_path());
            std::filesystem::create_directories(std::filesystem::path(path).parent_path());
        }
        WriteFile(paths::kNotifyRules, "");
        std::filesystem::remove(paths::kNotifyFilter);
        std::filesystem::remove(paths::kRules);
        createLogs();
    }
};

// Also with databases that a full volume left empty, and with rows that arrived while nobody followed.
TEST_F(QuorlogdProcess, CountsWhatIsStoredAndGoesOnWhereItEnded) {
    WriteFile(paths::kEventDb, "");
    WriteFile(paths::kAccountingDb, "");
    store(20000);
    {
        Quorlogd daemon;
        EXPECT_TRUE(counts(20000));
        store(3);
        EXPECT_TRUE(counts(20003)) << "woken by the change";
        EXPECT_EQ(Quorlogd().endOf(0), 1) << "a second one";
        store(10);
        EXPECT_EQ(daemon.endOf(SIGTERM), 0);
    }
    EXPECT_TRUE(counts(20013));
    store(7);
    Quorlogd daemon;
    EXPECT_TRUE(counts(20020));
    EXPECT_EQ(number(paths::kAccountingDb, "SELECT max(eps) FROM (SELECT sum(eps) AS eps FROM eps GROUP BY stamp)"),
              Strings{"119"})
        << "samples are of the seconds of the rows, which a backlog does not change";
}

TEST_F(QuorlogdProcess, CountsEqualRowsAfterEveryKill) {
    std::random_device random;
    WriteFile(paths::kNotifyRules, keywordRule("up"));
    int rows = 0;
    for (int i = 0; i < 5; ++i) {
        Quorlogd daemon("--max-notices 10");
        const auto end = std::chrono::steady_clock::now() + std::chrono::microseconds(random() % 600000);
        do {
            store(200);
            rows += 200;
            daemon.signal(SIGUSR2);
        } while (std::chrono::steady_clock::now() < end);
        EXPECT_EQ(daemon.endOf(SIGKILL), -1);
    }
    Quorlogd daemon;
    EXPECT_TRUE(counts(rows)) << testing::PrintToString(totals());
    EXPECT_EQ(number(paths::kEventDb, "PRAGMA integrity_check"), Strings{"ok"});
}

TEST_F(QuorlogdProcess, WaitsForADatabaseThatIsLocked) {
    Quorlogd daemon;
    store(3);
    ASSERT_TRUE(counts(3));
    {
        SqliteFile locked(paths::kAccountingDb);
        locked.run("BEGIN EXCLUSIVE");
        store(4);
        EXPECT_TRUE(daemon.says("Rows wait to be counted", SIGUSR2)) << daemon.messages();
    }
    EXPECT_TRUE(Eventually([&] {
        daemon.signal(SIGUSR2);
        return counts(7);
    }));
}

TEST_F(QuorlogdProcess, NoticesReplacedAndRestoredDatabases) {
    const std::string copy = std::string(paths::kWorkingDb) + ".copy";
    store(5);
    std::filesystem::copy_file(paths::kWorkingDb, copy);
    store(5);
    Quorlogd daemon;
    ASSERT_TRUE(counts(10));
    const auto replace = [&](const std::function<void()>& make) {
        for (const char* suffix : {"", "-wal", "-shm"}) {
            std::filesystem::remove(paths::kWorkingDb + std::string(suffix));
        }
        make();
    };
    replace(createLogs);
    store(4);
    EXPECT_TRUE(Eventually([] { return totals() == (Strings{"4", "14", "14"}); })) << "all rows of a new one are new";
    replace([&copy] { std::filesystem::copy_file(copy, paths::kWorkingDb); });
    EXPECT_TRUE(daemon.says(" 5 the last row", SIGUSR1)) << daemon.messages();
    store(2);
    EXPECT_TRUE(Eventually([] { return totals()[1] == "16"; }))
        << "rows of a copy were counted before: " << testing::PrintToString(totals());
}

TEST_F(QuorlogdProcess, MovesADamagedDatabaseAside) {
    store(3000);
    SqliteFile(paths::kWorkingDb).run("PRAGMA wal_checkpoint(TRUNCATE)");
    Quorlogd daemon;
    ASSERT_TRUE(counts(3000));
    const auto damage = [](uintmax_t at, size_t size) {
        std::fstream(paths::kWorkingDb, std::ios::in | std::ios::out | std::ios::binary).seekp(static_cast<off_t>(at))
            << std::string(size, '\xA5');
    };
    for (const char* total : {"6000", "9000"}) {
        const bool header = total[0] == '6';
        damage(header ? 0 : std::filesystem::file_size(paths::kWorkingDb) - 65536, 65536);
        EXPECT_TRUE(Eventually([] { return !std::filesystem::exists(paths::kWorkingDb); })) << daemon.messages();
        createLogs();
        store(3000);
        EXPECT_TRUE(Eventually([&] { return totals() == (Strings{"3000", total, total}); }));
        SqliteFile(paths::kWorkingDb).run("PRAGMA wal_checkpoint(TRUNCATE)");
    }
    const std::string event = std::string("Event detection: The log database was damaged: it is kept as ") +
                              paths::kWorkingDb + ".corrupt, and a new one begins";
    EXPECT_EQ(events(), Strings(2, event));
    EXPECT_TRUE(std::filesystem::exists(paths::kWorkingDb + std::string(".corrupt")));
}

// It kept no position, and no identity of the database.
TEST_F(QuorlogdProcess, CarriesOnTheCountsOfAFormerVersion) {
    store(50);
    SqliteFile(paths::kWorkingDb).run("DROP TABLE store_identity");
    SqliteFile(paths::kAccountingDb)
        .run("CREATE TABLE eps(id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);"
             "CREATE TABLE histogram(id INTEGER PRIMARY KEY, device TEXT UNIQUE, count INTEGER);"
             "INSERT INTO eps VALUES(1, 1, 'router1', 50); INSERT INTO histogram VALUES(1, 'router1', 50)");
    Quorlogd daemon;
    ASSERT_TRUE(daemon.started());
    ASSERT_TRUE(daemon.says(" 50 the last row", SIGUSR1)) << daemon.messages();
    store(2);
    EXPECT_TRUE(counts(52)) << testing::PrintToString(totals());
}

TEST_F(QuorlogdProcess, OneDeviceCannotSilenceTheOthers) {
    const std::string spool = paths::kNotifySpool + std::string("/desktop.jsonl");
    std::filesystem::remove(spool);
    WriteFile(paths::kSystemSettings, "desktop_notify_enabled=\"yes\"\n");
    Quorlogd daemon("--check-interval 1");
    ASSERT_TRUE(daemon.started());
    WriteFile(paths::kNotifyRules, keywordRule("it''s"));
    store(2, "it''s before the rule");
    ASSERT_TRUE(counts(2));
    WriteFile(paths::kNotifyRules, keywordRule("it's"));
    daemon.signal(SIGHUP);
    ASSERT_TRUE(daemon.says("Statistics: 2 rows, ", SIGUSR1));
    for (const char* address : {"127.0.0.1", "10.0.0.1"}) {  // the first is our own, and would set off another one
        SqliteFile(paths::kWorkingDb)
            .run("INSERT INTO logs(host, ip, prog, msg) VALUES('" + std::string(address) + "', '" + address +
                 "', 'quorlogd', 'it''s not sent')");
    }
    SqliteFile(paths::kWorkingDb)
        .run("INSERT INTO logs(host, ip, prog, msg, msgid, sdata) VALUES('data', '10.0.0.2', 'app', 'plain', 'ID', "
             "'it''s data')");
    store(1000, "it''s < a flood", "flood");
    for (int i = 0; i < 20; ++i) {
        store(1, "it''s down", "quiet" + std::to_string(i) + "-");
    }
    EXPECT_TRUE(counts(1025));
    const auto holding = [](const std::string& text) {
        const Strings all = events();
        return std::count_if(all.begin(), all.end(),
                             [&](const std::string& event) { return event.find(text) != std::string::npos; });
    };
    EXPECT_TRUE(Eventually([&] { return holding(": [quiet") == 20; })) << testing::PrintToString(events());
    EXPECT_EQ(holding("[10.0.0.1:") * 10 + holding("[127.0.0.1:"), 10);
    EXPECT_EQ(holding("app: plain ID it's data]"), 1);
    EXPECT_LE(holding("[flood"), 22);
    EXPECT_GE(holding("[flood1: 2026-11-21 05:15:54 kernel[7]: it's \u2039 a flood]"), 1);
    EXPECT_TRUE(Eventually([&] { return holding("more logs that match a rule were held back: flood") == 1; }));
    for (const char* text : {"it's < a flood", "announced one by one:\\nflood"}) {
        EXPECT_TRUE(Eventually([&] { return ReadFile(spool).find(text) != std::string::npos; })) << text;
    }
    std::filesystem::remove(paths::kSystemSettings);
}

std::string rulesFile(const std::string& sections) {
    return "version=\"1\"\n" + sections;
}

// A log of a host, received in that second.
void receive(const std::string& host, int second, const std::string& message = "Failed password") {
    SqliteFile(paths::kWorkingDb)
        .run("INSERT INTO logs(host, ip, prog, msg, rsec, ldate, ltime) VALUES('" + host + "', '10.0.0.1', 'sshd', '" +
             message + "', " + std::to_string(1795238154 + second) + ", '2026-11-21', '05:15:54')");
}

int eventsWith(const std::string& text) {
    const Strings all = events();
    return static_cast<int>(std::count_if(
        all.begin(), all.end(), [&](const std::string& event) { return event.find(text) != std::string::npos; }));
}

// Rows that waited count for their own seconds; a damaged file changes nothing.
TEST_F(QuorlogdProcess, ChecksTheRulesOfItsOwnFile) {
    WriteFile(paths::kRules, rulesFile("[three]\nkind=match\nprogram=sshd\nnot-host=test\nkeyword=Failed\ncount=3\n"
                                       "within=5m\n[new]\nkind=newdevice\n"));
    for (const char* host : {"web", "test"}) {
        for (const int second : {0, 150, 301, 449}) {
            receive(host, second);
        }
    }
    Quorlogd daemon;
    EXPECT_TRUE(Eventually([] { return eventsWith("Rule new: were heard for the first time: web, test") == 1; }))
        << testing::PrintToString(events());
    EXPECT_EQ(eventsWith("Rule three, 3 logs within 5m. Log content: [web: 2026-11-21 05:15:54 sshd: Failed password]"),
              1);
    EXPECT_EQ(eventsWith("no channel for notices is set up"), 1);
    WriteFile(paths::kRules, "rubbish");
    daemon.signal(SIGHUP);
    EXPECT_TRUE(
        daemon.says("rules.conf, line 1: neither a comment nor key=\"value\"; the rules of before stay in force"));
    for (const int second : {1000, 1001, 1002}) {
        receive("other", second);
    }
    EXPECT_TRUE(Eventually([] { return eventsWith("Log content: [other: ") == 1; }))
        << testing::PrintToString(events());
    EXPECT_EQ(eventsWith("Rule three"), 2) << testing::PrintToString(events());
    std::filesystem::remove(paths::kRules);
}

TEST_F(QuorlogdProcess, TellsWhoWentSilentOnceAcrossKills) {
    WriteFile(paths::kRules, rulesFile("[s]\nkind=silent\nafter=30m\ninterval=0s\nhost=\"a,b,never\"\n"));
    const auto talk = [](const std::string& host, int from, int to) {
        for (int second = from; second < to; second += 40) {
            receive(host, second);
        }
    };
    {
        Quorlogd daemon;
        receive("a", 0);
        talk("b", 0, 2000);
        EXPECT_TRUE(Eventually([] { return eventsWith("Rule s: nothing is heard any more of a (last heard ") == 1; }))
            << testing::PrintToString(events());
        EXPECT_EQ(eventsWith("a (last heard 2026-11-21T") + eventsWith(", never (never heard)"), 2);
        EXPECT_EQ(daemon.endOf(SIGKILL), -1);
    }
    talk("b", 2000, 4000);
    {
        Quorlogd daemon;
        ASSERT_TRUE(daemon.started());
        ASSERT_TRUE(daemon.says(" 101 the last row", SIGUSR1)) << daemon.messages();
        receive("a", 4001);
        EXPECT_TRUE(Eventually([] { return eventsWith("Rule s: is heard again: a") == 1; }))
            << testing::PrintToString(events());
        EXPECT_EQ(daemon.endOf(SIGTERM), 0);
    }
    Quorlogd daemon;
    ASSERT_TRUE(daemon.started());
    usleep(6000000);
    EXPECT_EQ(eventsWith("Rule s"), 2) << testing::PrintToString(events());
    std::filesystem::remove(paths::kRules);
}

// A socket that nobody reads, after `count` datagrams; what it could not take is lost.
class Overflowing {
  public:
    explicit Overflowing(int count) {
        const int least = 1;
        const std::string datagram(500, 'x');
        socklen_t size = sizeof address_;
        (void)setsockopt(socket_.get(), SOL_SOCKET, SO_RCVBUF, &least, sizeof least);
        address_.sin_family = AF_INET;
        address_.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        (void)bind(socket_.get(), reinterpret_cast<sockaddr*>(&address_), sizeof address_);
        (void)getsockname(socket_.get(), reinterpret_cast<sockaddr*>(&address_), &size);
        for (int i = 0; i < count; ++i) {
            (void)sendto(socket_.get(), datagram.data(), datagram.size(), 0, reinterpret_cast<sockaddr*>(&address_),
                         sizeof address_);
        }
    }
    std::string port() const { return std::to_string(ntohs(address_.sin_port)); }

  private:
    Descriptor socket_{socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
    sockaddr_in address_{};
};

TEST_F(QuorlogdProcess, TellsWhatWasDroppedOnceAndWhatWaits) {
    const TempFolder folder;
    const auto answer = [&folder](int dropped, int queued, int written) {
        const std::string line = "dst.sql;d_quor_database#0;sqlite3,,,a;b,logs;a;";
        folder.write("next", "dst.sql;other#0;;a;dropped;9\n" + line + "dropped;" + std::to_string(dropped) + "\n" +
                                 line + "queued;" + std::to_string(queued) + "\n" + line + "written;" +
                                 std::to_string(written) + "\n.\n");
        std::filesystem::rename(folder.path("next"), folder.path("answer"));
    };
    const auto has = [](const std::string& begin, const std::string& end) {
        return Eventually([&] {
            const Strings all = events();
            return std::count_if(all.begin(), all.end(), [&](const std::string& event) {
                       return event.find(begin) != std::string::npos && event.find(end) != std::string::npos;
                   }) == 1;
        });
    };
    answer(5, 0, 10);
    const Overflowing udp(100);
    const Child control("/usr/bin/python3 " SOURCE_FOLDER "/tests/quorlogd/control.py " + folder.path("ctl") + " " +
                        folder.path("answer"));
    ASSERT_TRUE(Eventually([&] { return std::filesystem::exists(folder.path("ctl")); }));
    const std::string options = "--check-interval 1 --udp-port " + udp.port() + " --control " + folder.path("ctl");
    {
        Quorlogd daemon(options);
        EXPECT_TRUE(has("messages were dropped since the start of syslog-ng: 9", ", 5 that syslog-ng could not keep"))
            << testing::PrintToString(events());
        EXPECT_TRUE(
            Eventually([] { return std::filesystem::exists(paths::kRunFolder + std::string("/quorlogd.losses")); }));
        EXPECT_EQ(daemon.endOf(SIGKILL), -1);
    }
    answer(8, 7, 10);
    Quorlogd daemon(options);
    EXPECT_TRUE(has("[3] messages were dropped since 2", ": 0 that")) << testing::PrintToString(events());
    EXPECT_TRUE(has("The log database takes no messages since ", ", [7] wait"));
    usleep(2500000);
    answer(8, 9, 11);
    EXPECT_TRUE(has("The log database takes messages again", ""));
    EXPECT_EQ(events().size(), 4U) << testing::PrintToString(events());
}

TEST_F(QuorlogdProcess, AnnouncesWhoHoldsTheConnectionsOfAPort) {
    const Descriptor server(socket(AF_INET6, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_in6 address{};
    socklen_t size = sizeof address;
    address.sin6_family = AF_INET6;
    (void)bind(server.get(), reinterpret_cast<sockaddr*>(&address), size);
    (void)listen(server.get(), 20);
    (void)getsockname(server.get(), reinterpret_cast<sockaddr*>(&address), &size);
    const std::string port = std::to_string(ntohs(address.sin6_port));
    const std::string values = paths::kReceiverValues + std::string("/receiving-9.conf");
    WriteFile(values, "@define quor_port_framed \"" + port + "\"\n@define quor_connections \"10\" # few\n");
    sockaddr_in local{};
    local.sin_family = AF_INET;
    local.sin_port = address.sin6_port;
    local.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
    std::vector<Descriptor> senders;
    const auto hold = [&](size_t count) {
        senders.resize(std::min(senders.size(), count));
        while (senders.size() < count) {
            senders.emplace_back(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0));
            ASSERT_EQ(connect(senders.back().get(), reinterpret_cast<sockaddr*>(&local), sizeof local), 0);
        }
    };
    hold(8);
    Quorlogd daemon("--check-interval 1");
    ASSERT_TRUE(daemon.started());
    usleep(1500000);
    EXPECT_EQ(events(), Strings{});
    for (const size_t count : {9U, 7U, 9U}) {  // told once
        hold(count);
        usleep(1500000);
    }
    std::filesystem::remove(values);
    // The tables of an emulated machine are in the byte order of the one beneath it.
    const std::string holder = std::string(QUORLOGD).front() == ' ' ? "127.0.0.1" : "::ffff:0:100:7f";
    EXPECT_EQ(events(),
              Strings{"Event detection: TCP port " + port + " has [9] of 10 connections, [9] of them from " + holder});
}

TEST_F(QuorlogdProcess, RaisesAFullVolumeOnceAndKeepsTheEventLogSmall) {
    SqliteFile(paths::kEventDb)
        .run(ReadFile(paths::kEventSchema) + "WITH n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 15001) "
                                             "INSERT INTO log SELECT i, 0, i, 'SYSTEM', 'Server was old' FROM n");
    Quorlogd daemon("--volume / --volume-full 0.000001 --check-interval 1");
    EXPECT_TRUE(Eventually([] { return events() == Strings{"Volume space is not enough."}; }));
    EXPECT_TRUE(Eventually([] {
        return number(paths::kEventDb, "SELECT count(*) BETWEEN 10000 AND 10010, max(id) > 15000 FROM log") ==
               (Strings{"1", "1"});
    }));
    usleep(1500000);
    EXPECT_EQ(events().size(), 1U) << "another check";
}

}  // namespace
