// Every disk access and every allocation of an operation fails once, and then for good from there on; and a real disk
// is full. The operation says so or succeeds, holds on to nothing, leaves the old or the new state and a sound
// database, and works the next time.
#include <sched.h>
#include <sys/mount.h>

#include <numeric>
#include <set>

#include "accounting.h"
#include "common/handles.h"
#include "dbhandler.h"
#include "logger.h"
#include "logger/eventdb.h"
#include "parser.h"
#include "platform/notify/spool.h"
#include "quor/quorfs.h"
#include "quor/quorsalvage.h"
#include "tests/support/clock.h"
#include "tests/support/faults.h"
#include "tests/support/notices.h"
#include "tests/support/services.h"
#include "tests/support/testing.h"

namespace quor::test {
namespace {

// What an operation works on: a fresh folder, and what it read there.
struct Place {
    TempFolder folder;
    std::string db = folder.path("x.db");
    std::string seen;
    std::unique_ptr<AccountingManager> accounting;
};

enum class Promise {
    AllOrNothing,
    CommitUnasked,  // success is reported although the commit may have failed
    Repeats,        // the same, and what stands when it fails is written once more by the next call
};

struct Operation {
    const char* name;
    void (*prepare)(Place&);
    int (*run)(Place&);  // negative: failed
    std::string (*state)(const Place&);
    Promise promise = Promise::AllOrNothing;
    bool faultyDiskOnly = false;  // slow, or not to be had on a full disk; its allocations are those of another one
};

// The answer to a query; a table or file that is not there yet has none.
std::string answer(const std::string& db, const std::string& sql) {
    std::string text;
    if (access(db.c_str(), F_OK) != 0) {
        return "ok ";
    }
    try {
        for (const std::string& field : SqliteFile(db).query("PRAGMA integrity_check; " + sql)) {
            text += field + " ";
        }
    } catch (const std::runtime_error& error) {
        return std::string(error.what()).find("no such table") != std::string::npos ? "ok " : error.what();
    }
    return text;
}

// The files of a folder but for those that SQLite keeps beside a database.
std::string files(const std::string& folder) {
    std::set<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        const std::string name = entry.path().filename();
        if (name.find(".db-") == std::string::npos) {
            names.insert(name + " ");
        }
    }
    return std::accumulate(names.begin(), names.end(), std::string());
}

constexpr const char* kLogs =
    "CREATE TABLE logs(id INTEGER PRIMARY KEY, host TEXT, utcsec INTEGER, prio TEXT, msg TEXT);"
    "CREATE TABLE db_info(id INTEGER PRIMARY KEY, start_time, end_time, log_count, device);"
    "INSERT INTO db_info VALUES(1, 1, 2, 3, 'd');"
    "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 300) INSERT INTO logs(host, utcsec, "
    "prio, msg) SELECT 'h' || (i % 3), i, 'info', hex(zeroblob(100)) FROM n;";

std::list<_SYSLOG_SQL_COND_tag> condition() {
    return {{SYSLOG_ATTRI_HOST, 0, "h1", {}}};
}

int remove(Place& place) {
    auto conditions = condition();
    return SyslogDBDelete(place.db, conditions);
}

int search(Place& place) {
    auto conditions = condition();
    const auto take = [](_SYSLOG_LOG_DATA_tag& log, void* seen) {
        static_cast<std::string*>(seen)->append(std::to_string(log.id));
        return 0;
    };
    return SyslogDBSelect(place.db, conditions, nullptr, nullptr, take, &place.seen, true);
}

int setEnd(Place& place) {
    EventDb db(place.db);
    return db.connect() ? db->DBInfoEndSet(77) : -1;
}

int moveAside(Place& place) {
    return DBErrorHandle_SQLITE_CORRUPT(nullptr, place.db);
}

int addEvent(Place& place) {
    return Logger().LogAdd(place.db, 1, "user", "event");
}

int setRule(Place& place) {
    _SYSLOG_NOTIFY_RULES_tag rule;
    rule.name = "new";
    return SyslogNotifyConfSet(place.folder.path("rules"), "old", rule);
}

int queueNotice(Place& place) {
    notify::Notice notice;
    notice.subject = "subject";
    const notify::Spool spool(0);
    place.seen = spool && spool.put(notice) ? "queued" : "";
    return place.seen.empty() ? -1 : 0;
}

int salvage(Place& place) {
    const char* const schemas[] = {nullptr};
    QUORSALVAGE report{};
    const int result =
        QUORDBSalvage(place.db.c_str(), place.folder.path("new.db").c_str(), schemas, nullptr, nullptr, &report);
    return result < 0 && report.error[0] == '\0' ? 1 : result;
}

// More than is kept in memory.
int selectMuch(Place& place) {
    const Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, place.db.c_str()));
    Result result;
    const int status = QUORDBExecute(connection.get(), "SELECT zeroblob(1000000) FROM logs LIMIT 80", Adopt(result));
    place.seen = status < 0 ? "" : std::to_string(QUORDBNumRows(result.get()));
    return status;
}

int flush(Place& place) {
    return place.accounting->AccoutingFlush2DB();
}

int checkpoint(Place& place) {
    EventDb db(place.db);
    return db.connect() ? db->DBWalCheckpoint(true) : -1;
}

int parse(Place& place) {
    LogParser parser;
    std::string chunk = "user err 2026-01-02 10:00:00 1 1 +00:00 nas 10.0.0.1 app t hello\nuser err 2026";
    const int result = parser.LogAdd(chunk);
    place.seen = std::to_string(parser.LogGetCount());
    return result;
}

void logs(Place& place) {
    SqliteFile(place.db).run(kLogs);
}

void walLogs(Place& place) {
    SqliteFile(place.db).run(std::string("PRAGMA journal_mode=WAL;") + kLogs);
}

// As after a power cut: the rows stand in the write-ahead log alone.
void unfinishedLogs(Place& place) {
    SqliteFile db(place.folder.path("t.db"));
    db.run("PRAGMA journal_mode=WAL");
    db.run(kLogs);
    (void)place.folder.write("x.db", ReadFile(place.folder.path("t.db")));
    (void)place.folder.write("x.db-wal", ReadFile(place.folder.path("t.db-wal")));
}

void counts(Place& place) {
    WriteFile(paths::kAccountingDb, "");
    SqliteFile(paths::kAccountingDb)
        .run(ReadFile(paths::kAccountingSchema) + "INSERT INTO histogram VALUES(1, 'a', 5);");
    SetClock(1000);
    place.accounting = std::make_unique<AccountingManager>();
    place.accounting->LogInc("a");
    place.accounting->LogInc("new");
    SetClock(1001);
    place.accounting->CurEpsUpdate();
}

void events(Place& place) {
    SqliteFile(place.db).run(ReadFile(paths::kEventSchema));
}

void nothing(Place& /*place*/) {}

std::string logState(const Place& place) {
    return answer(place.db, "SELECT COUNT(*), SUM(id) FROM logs UNION ALL SELECT end_time, 0 FROM db_info");
}

std::string eventState(const Place& place) {
    return answer(place.db, "SELECT user, event FROM log");
}

std::string salvagedState(const Place& place) {
    const std::string names = files(place.folder.path());
    return names.find("new") != std::string::npos
               ? names + answer(place.folder.path("new.db"), "SELECT COUNT(*) FROM logs")
               : names;
}

constexpr Operation kOperations[] = {
    {"delete", logs, remove, logState},
    {"delete from a write-ahead log", walLogs, remove, logState},
    {"search", logs, search, logState},
    {"set the end time", walLogs, setEnd, logState},
    {"move a corrupt database aside", logs, moveAside, [](const Place& place) { return files(place.folder.path()); }},
    {"checkpoint", unfinishedLogs, checkpoint, logState},
    {"record an event", events, addEvent, eventState, Promise::CommitUnasked},
    {"record the first event", nothing, addEvent, eventState, Promise::CommitUnasked, true},
    {"flush the accounting", counts, flush,
     [](const Place&) {
         return answer(paths::kAccountingDb, "SELECT device, count FROM histogram UNION SELECT device, eps "
                                             "FROM eps ORDER BY 1");
     },
     Promise::Repeats},
    {"set a rule", [](Place& place) { (void)place.folder.write("rules", "[a]\nb=\"c\"\n[old]\nd=\"e\"\n"); }, setRule,
     [](const Place& place) { return ReadFile(place.folder.path("rules")) + files(place.folder.path()); }},
    {"queue a notice", [](Place&) { std::filesystem::remove_all(paths::kNotifySpool); }, queueNotice,
     [](const Place&) { return std::string(); }},
    {"salvage", walLogs, salvage, salvagedState},
    {"select more than memory holds", logs, selectMuch, logState, Promise::AllOrNothing, true},
    {"parse", nothing, parse, [](const Place&) { return std::string(); }},
    {"create folders", nothing,
     [](Place& place) { return QUORFSMkdirP(place.folder.path("a/b/c").c_str(), 0, 0, -1, -1, 0700); },
     [](const Place& place) {
         return std::string(access(place.folder.path("a/b/c").c_str(), F_OK) == 0 ? "made" : "");
     }},
};

int64_t openFiles() {
    const std::filesystem::directory_iterator descriptors("/proc/self/fd");
    return std::distance(begin(descriptors), end(descriptors));
}

struct Case {
    Operation operation;
    Resource resource;
    bool onwards;
};

void PrintTo(const Case& each, std::ostream* stream) {
    *stream << each.operation.name << (each.resource == Resource::Disk ? ", disk" : ", memory")
            << (each.onwards ? " from then on" : " once");
}

std::vector<Case> cases() {
    std::vector<Case> all;
    for (const Operation& operation : kOperations) {
        for (const bool onwards : {false, true}) {
            all.push_back({operation, Resource::Disk, onwards});
            if (!operation.faultyDiskOnly) {
                all.push_back({operation, Resource::Memory, onwards});
            }
        }
    }
    return all;
}

void forget() {
    TakeSystemLog();
    FakeNotices() = {};
    FakeServices() = {};
}

// An operation in its place, and what it makes of it when all is well.
class Trial {
  public:
    explicit Trial(const Operation& operation) : operation_(operation) {
        Place place;
        operation_.prepare(place);
        before_ = operation_.state(place);
        EXPECT_GE(run(place), 0);  // also: what is allocated once for the life of the process is
        after_ = operation_.state(place) + place.seen;
        forget();
    }

    // An allocation that fails may come out as an exception.
    int run(Place& place) const {
        try {
            return operation_.run(place);
        } catch (const std::bad_alloc&) {
            return -1;
        }
    }

    // All or nothing, as the result says; and all the next time.
    void judge(int result, Place& place) const {
        const std::string seen = std::exchange(place.seen, {});
        const std::string state = operation_.state(place);
        const bool undone = result < 0 || operation_.promise != Promise::AllOrNothing;
        const bool partial = result < 0 && operation_.promise == Promise::Repeats && state.rfind("ok ", 0) == 0;
        EXPECT_TRUE(state + seen == after_ || (undone && (state == before_ || state == after_)) || partial)
            << state << seen;
        if (result < 0 && state != after_) {
            EXPECT_GE(run(place), 0);
            EXPECT_EQ(operation_.state(place) + place.seen, after_);
        }
    }

  private:
    const Operation& operation_;
    std::string before_;
    std::string after_;
};

class Faults : public testing::TestWithParam<Case> {};

TEST_P(Faults, AreReportedAndLeaveNothingHalfDone) {
    const Case& each = GetParam();
    SetClock(1000);
    const Trial trial(each.operation);
    bool struck = true;
    for (int nth = 1; struck && !HasFailure(); ++nth) {
        SCOPED_TRACE(nth);
        Place place;
        each.operation.prepare(place);
        forget();
        const int64_t filesBefore = openFiles();
        const int64_t blocksBefore = LiveBlocks();
        int result = 0;
        {
            const Fault fault(each.resource, nth, each.onwards);
            result = trial.run(place);
            struck = Fault::struck();
        }
        forget();
        EXPECT_EQ(openFiles(), filesBefore);
        EXPECT_LE(LiveBlocks(), blocksBefore + (place.seen.capacity() > 15 ? 1 : 0));
        EXPECT_TRUE(struck || result >= 0);
        trial.judge(result, place);
    }
}

INSTANTIATE_TEST_SUITE_P(Everywhere, Faults, testing::ValuesIn(cases()));

// A small file system of this process alone, on which everything that is written stands.
bool mountSmallDisk(const std::string& folder) {
    std::filesystem::create_directories(folder);
    return (unshare(CLONE_NEWNS) == 0 || unshare(CLONE_NEWUSER | CLONE_NEWNS) == 0) &&
           mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0 &&
           mount("none", folder.c_str(), "tmpfs", 0, "size=1m") == 0 && setenv("TMPDIR", folder.c_str(), 1) == 0;
}

TEST(FullDisk, IsReportedAndLeavesNothingHalfDone) {
    const std::string disk = QUOR_ROOT "/var";
    if (!mountSmallDisk(disk)) {
        GTEST_SKIP() << "no file system can be mounted here";
    }
    int failures = 0;
    for (const Operation& operation : kOperations) {
        if (operation.faultyDiskOnly) {
            continue;
        }
        const Trial trial(operation);
        for (size_t spare = 0; spare < 64 && !HasFailure(); spare += 4) {
            SCOPED_TRACE(std::string(operation.name) + " with KiB left: " + std::to_string(spare));
            Place place;
            operation.prepare(place);
            const auto left = static_cast<size_t>(std::filesystem::space(disk).available) - spare * 1024;
            WriteFile(disk + "/ballast", std::string(left, '.'));
            const int result = trial.run(place);
            failures += result < 0 ? 1 : 0;
            std::filesystem::remove(disk + "/ballast");
            trial.judge(result, place);
        }
    }
    forget();
    EXPECT_GT(failures, 0);
    EXPECT_EQ(umount(disk.c_str()) + unsetenv("TMPDIR"), 0);
}

}  // namespace
}  // namespace quor::test
