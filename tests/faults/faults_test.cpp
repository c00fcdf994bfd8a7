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
#include "platform/notify/spool.h"
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
    Repeats,        // the same, and what is there when it fails is written once more by the next call
};

struct Operation {
    const char* name;
    void (*prepare)(Place&);
    int (*run)(Place&);  // negative: failed
    const char* state;   // a query for what it changes in the database; null: the files of the folder
    Promise promise = Promise::AllOrNothing;
    bool faultyDiskOnly = false;  // slow, or too large for a small disk; its allocations are those of another one
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

// Files with their contents, but for those that SQLite keeps beside a database.
std::string files(const std::string& folder) {
    std::set<std::string> found;
    for (const auto& entry : std::filesystem::directory_iterator(folder)) {
        const std::string name = entry.path().filename();
        if (name.find(".db-") == std::string::npos) {
            found.insert(name + " " + ReadFile(entry.path()));
        }
    }
    return std::accumulate(found.begin(), found.end(), std::string());
}

constexpr const char* kLogs =
    "CREATE TABLE logs(id INTEGER PRIMARY KEY, host TEXT, utcsec INTEGER, prio TEXT, msg TEXT);"
    "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 300) INSERT INTO logs(host, utcsec, "
    "prio, msg) SELECT 'h' || (i % 3), i, 'info', hex(zeroblob(100)) FROM n;";
constexpr const char* kLogState = "SELECT COUNT(*), SUM(id) FROM logs";
constexpr const char* kEventState = "SELECT user, event FROM log";

int remove(Place& place) {
    std::list<_SYSLOG_SQL_COND_tag> conditions{{SYSLOG_ATTRI_HOST, 0, "h1", {}}};
    return SyslogDBDelete(place.db, conditions);
}

int search(Place& place) {
    std::list<_SYSLOG_SQL_COND_tag> conditions{{SYSLOG_ATTRI_HOST, 0, "h1", {}}};
    const auto take = [](_SYSLOG_LOG_DATA_tag& log, void* seen) {
        static_cast<std::string*>(seen)->append(std::to_string(log.id));
        return 0;
    };
    return SyslogDBSelect(place.db, conditions, nullptr, nullptr, take, &place.seen, true);
}

int checkpoint(Place& place) {
    EventDb db(place.db);
    return db.connect() ? db->DBWalCheckpoint(true) : -1;
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
    const notify::Spool spool(0);
    place.seen = spool && spool.put("mail", {}) ? "queued" : "";
    return place.seen.empty() ? -1 : 0;
}

int salvage(Place& place) {
    const std::string fresh = place.folder.path("new.db");
    QUORSALVAGE report{};
    const int result = QUORDBSalvage(place.db.c_str(), fresh.c_str(), nullptr, nullptr, nullptr, &report);
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

void logs(Place& place) {
    SqliteFile(place.db).run(kLogs);
}

void walLogs(Place& place) {
    SqliteFile(place.db).run(std::string("PRAGMA journal_mode=WAL;") + kLogs);
}

// As after a power cut: the rows are in the write-ahead log alone.
void unfinishedLogs(Place& place) {
    SqliteFile db(place.folder.path("t.db"));
    db.run("PRAGMA journal_mode=WAL");
    db.run(kLogs);
    (void)place.folder.write("x.db", ReadFile(place.folder.path("t.db")));
    (void)place.folder.write("x.db-wal", ReadFile(place.folder.path("t.db-wal")));
}

void counts(Place& place) {
    place.db = paths::kAccountingDb;
    WriteFile(place.db, "");
    SqliteFile(place.db).run(ReadFile(paths::kAccountingSchema) + "INSERT INTO histogram VALUES(1, 'a', 5);");
    SetClock(1000);
    place.accounting = std::make_unique<AccountingManager>();
    place.accounting->LogInc("a");
    place.accounting->LogInc("new");
    SetClock(1001);
    place.accounting->CurEpsUpdate();
}

constexpr Operation kOperations[] = {
    {"delete", logs, remove, kLogState},
    {"delete from a write-ahead log", walLogs, remove, kLogState},
    {"search", logs, search, kLogState},
    {"move a corrupt database aside", logs,
     [](Place& place) { return DBErrorHandle_SQLITE_CORRUPT(nullptr, place.db); }, nullptr},
    {"checkpoint", unfinishedLogs, checkpoint, kLogState},
    {"record an event", [](Place& place) { SqliteFile(place.db).run(ReadFile(paths::kEventSchema)); }, addEvent,
     kEventState, Promise::CommitUnasked},
    {"record the first event", [](Place&) {}, addEvent, kEventState, Promise::CommitUnasked, true},
    {"flush the accounting", counts, [](Place& place) { return place.accounting->AccoutingFlush2DB(); },
     "SELECT device, count FROM histogram UNION SELECT device, eps FROM eps ORDER BY 1", Promise::Repeats},
    {"set a rule", [](Place& place) { (void)place.folder.write("rules", "[a]\nb=\"c\"\n[old]\nd=\"e\"\n"); }, setRule,
     nullptr},
    {"queue a notice", [](Place&) { std::filesystem::remove_all(paths::kNotifySpool); }, queueNotice, nullptr},
    {"salvage", walLogs, salvage, nullptr},
    {"select more than memory holds", logs, selectMuch, kLogState, Promise::AllOrNothing, true},
};

int64_t openFiles() {
    const std::filesystem::directory_iterator descriptors("/proc/self/fd");
    return std::distance(begin(descriptors), end(descriptors));
}

void PrintTo(const Operation& operation, std::ostream* stream) {
    *stream << operation.name;
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
        before_ = stateOf(place);
        EXPECT_GE(run(place), 0);  // also: what is allocated once for the life of the process is
        after_ = stateOf(place) + place.seen;
        forget();
    }

    std::string stateOf(const Place& place) const {
        return operation_.state != nullptr ? answer(place.db, operation_.state) : files(place.folder.path());
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
        const std::string state = stateOf(place);
        const bool undone = result < 0 || operation_.promise != Promise::AllOrNothing;
        const bool partial = result < 0 && operation_.promise == Promise::Repeats && state.rfind("ok ", 0) == 0;
        EXPECT_TRUE(state + seen == after_ || (undone && (state == before_ || state == after_)) || partial)
            << state << seen;
        if (result < 0 && state != after_) {
            EXPECT_GE(run(place), 0);
            EXPECT_EQ(stateOf(place) + place.seen, after_);
        }
    }

  private:
    const Operation& operation_;
    std::string before_;
    std::string after_;
};

class Faults : public testing::TestWithParam<std::tuple<Operation, Resource, bool>> {};

TEST_P(Faults, AreReportedAndLeaveNothingHalfDone) {
    const auto& [operation, resource, onwards] = GetParam();
    if (operation.faultyDiskOnly && resource == Resource::Memory) {
        return;
    }
    SetClock(1000);
    const Trial trial(operation);
    bool struck = true;
    for (int nth = 1; struck && !HasFailure(); ++nth) {
        SCOPED_TRACE(nth);
        Place place;
        operation.prepare(place);
        forget();
        const int64_t filesBefore = openFiles();
        const int64_t blocksBefore = LiveBlocks();
        int result = 0;
        {
            const Fault fault(resource, nth, onwards);
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

INSTANTIATE_TEST_SUITE_P(Everywhere, Faults,
                         testing::Combine(testing::ValuesIn(kOperations),
                                          testing::Values(Resource::Disk, Resource::Memory), testing::Bool()));

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
