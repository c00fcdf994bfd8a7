#include "store/exchange.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <optional>

#include "dbhandler.h"
#include "store/ask.h"
#include "store/counted.h"
#include "store/databasefile.h"
#include "store/failure.h"
#include "store/merge.h"
#include "store/receiving.h"
#include "store/selection.h"

namespace quor::store {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::seconds;

constexpr useconds_t kMoment = 200000;

// A signal must not end the process between two steps that belong together.
class SignalsHeld {
  public:
    SignalsHeld() {
        sigset_t held;
        sigemptyset(&held);
        for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT}) {
            sigaddset(&held, number);
        }
        sigprocmask(SIG_BLOCK, &held, &before_);
    }
    SignalsHeld(const SignalsHeld&) = delete;
    SignalsHeld& operator=(const SignalsHeld&) = delete;
    ~SignalsHeld() { sigprocmask(SIG_SETMASK, &before_, nullptr); }

  private:
    sigset_t before_{};
};

// What fails leaves nothing changed that matters.
void require(bool done, const std::string& what) {
    if (!done) {
        throw Failure(what + ": " + strerror(errno) +
                          "; make sure that you may write to the folder, and that no other "
                          "program begins a database there",
                      Cause::Other);
    }
}

bool isThere(const std::string& path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0;
}

uint64_t newestOf(const Source& source) try { return LargestId(source, "logs"); } catch (const Failure& failure) {
    if (failure.cause() != Cause::Missing) {
        throw;
    }
    return 0;  // syslog-ng makes the table with the first row
}

// Keeps others from writing while it lives; a write-ahead log lets them read.
class Freeze {
  public:
    explicit Freeze(const std::string& db) : connection_(Connect(db)) {
        const Result mode = Execute(connection_, db, "PRAGMA journal_mode = WAL");
        Row row(mode.get());
        if (!row.next() || row["journal_mode"] != std::string("wal")) {
            throw Failure(db + " is in use by a program without a write-ahead log; end that, and try again",
                          Cause::Busy);
        }
        (void)Execute(connection_, db, "BEGIN IMMEDIATE");
    }
    void end() { connection_.reset(); }

  private:
    Connection connection_;
};

// quorlogd writes its counts when it is told to, and a sample is complete a moment after its last row. One that does
// not know the database follows another one.
void awaitCounts(const Source& source) {
    constexpr seconds kPatience{15};
    constexpr seconds kUnknown{3};
    const Clock::time_point start = Clock::now();
    const uint64_t newest = newestOf(source) == 0 ? 0 : NewestReceived(source);
    for (int process = FollowerProcess(); process != 0 && newest != 0; process = FollowerProcess()) {
        (void)kill(process, SIGUSR2);
        const std::optional<uint64_t> counted = CountedUpTo(source);
        const auto waited = Clock::now() - start;
        if ((counted && *counted >= newest) || (!counted && waited > kUnknown)) {
            return;
        }
        if (waited > kPatience) {
            throw Failure("quorlogd has not counted the rows of " + source.name() +
                              " yet; try again when quorlog doctor says that it has, or stop it",
                          Cause::Busy);
        }
        (void)usleep(kMoment);
    }
}

void addColumns(const std::string& draft, const std::string& db) {
    const std::vector<StoredColumn> there = StoredColumns(draft);
    for (const StoredColumn& column : StoredColumns(db)) {
        const bool known = std::any_of(there.begin(), there.end(),
                                       [&column](const StoredColumn& other) { return other.name == column.name; });
        if (!known) {
            (void)Ask(draft, "ALTER TABLE logs ADD COLUMN " + column.name + " " + column.type, "");
        }
    }
}

// The rows that came since the draft was copied. Deletions since then would come back with it.
void addNewer(const std::string& draft, const std::string& db) {
    const Connection connection = Connect(draft);
    (void)Execute(connection, draft, "ATTACH " + Literal(db) + " AS live");
    const Result same =
        Execute(connection, draft,
                "SELECT 1 WHERE (SELECT count(*) FROM main.logs) = (SELECT count(*) FROM live.logs) - "
                "(SELECT count(*) FROM live.logs WHERE id > (SELECT ifnull(max(id), 0) FROM main.logs))");
    if (QUORDBNumRows(same.get()) != 1) {
        throw Failure("rows of " + db + " were deleted meanwhile; run it again", Cause::Busy);
    }
    std::string columns = "id";
    for (const StoredColumn& column : StoredColumns(db)) {
        columns += ", " + column.name;
    }
    (void)Execute(connection, draft,
                  "INSERT INTO main.logs (" + columns + ") SELECT " + columns +
                      " FROM live.logs WHERE id > (SELECT ifnull(max(id), 0) FROM main.logs) ORDER BY id");
}

// Rows of the draft that are counted already must not be counted again: they are noted as brought.
void stamp(const std::string& draft, uint64_t counted) {
    const Connection connection = Connect(draft);
    const std::string last = Decimal(counted);
    for (const std::string& sql :
         {std::string(
              "CREATE TABLE IF NOT EXISTS store_identity (id INTEGER PRIMARY KEY CHECK (id = 1), value TEXT NOT "
              "NULL)"),
          std::string("INSERT OR REPLACE INTO store_identity VALUES (1, lower(hex(randomblob(16))))"),
          std::string("CREATE TABLE IF NOT EXISTS store_merged (first INTEGER PRIMARY KEY, last INTEGER NOT NULL)"),
          "DELETE FROM store_merged WHERE last <= " + last + " OR last > (SELECT ifnull(max(id), 0) FROM logs)",
          "INSERT OR REPLACE INTO store_merged SELECT 1, counted FROM (SELECT " + last +
              " AS counted) WHERE counted > 0",
          std::string("PRAGMA journal_mode = WAL")}) {
        (void)Execute(connection, draft, sql);
    }
}

void finishFile(const std::string& draft, const std::string& like, bool replaces) {
    struct stat status {};
    require(stat(like.c_str(), &status) == 0, "cannot look at " + like);
    const Descriptor file(open(draft.c_str(), O_RDONLY | O_CLOEXEC));
    (void)fchown(file.get(), replaces ? status.st_uid : geteuid(), status.st_gid);  // only root may
    require(file && fchmod(file.get(), replaces ? status.st_mode & 0777U : 0640) == 0 && fsync(file.get()) == 0,
            "cannot write " + draft);
}

std::string freeName(const std::string& db, const std::string& label) {
    const std::time_t now = time(nullptr);
    std::tm local{};
    char text[32] = "";
    (void)strftime(text, sizeof text, "%Y%m%d-%H%M%S", localtime_r(&now, &local));
    const std::string name = db + "." + label + "-" + text;
    std::string aside = name;
    for (int number = 2; isThere(aside) || isThere(aside + "-wal") || isThere(aside + "-shm"); ++number) {
        aside = name + "-" + std::to_string(number);
    }
    return aside;
}

// The companions get their second name first and lose the first one last, so that the rows in them are never without a
// name: a program that begins a database in between would remove them. The name `db` is never taken from another file.
void moveAside(const std::string& db, const std::string& aside) {
    for (const char* companion : {"-wal", "-shm"}) {
        require(!isThere(db + companion) || link((db + companion).c_str(), (aside + companion).c_str()) == 0,
                "cannot move " + db + companion);
    }
    require(rename(db.c_str(), aside.c_str()) == 0, "cannot move " + db);
    RemoveCompanions(db);
}

void place(const std::string& draft, const std::string& db, const std::string& aside) {
    const std::string where = aside.empty() ? "" : "; the former database is " + aside;
    require(link(draft.c_str(), db.c_str()) == 0, "cannot put the new database at " + db + where);
    (void)unlink(draft.c_str());
    const std::string folder = std::filesystem::path(db).parent_path();
    const Descriptor opened(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    (void)fsync(opened.get());  // the names are right in any case
}

// A database leaves its write-ahead log only when nobody else has it open. So this is the proof that syslog-ng has gone
// on to the new one, and leaves one file.
bool isReleased(const std::string& aside) try {
    return Ask(aside, "PRAGMA journal_mode = DELETE", "journal_mode") == std::vector<std::string>{"delete"};
} catch (const Failure& failure) {
    if (failure.cause() != Cause::Busy) {
        throw;
    }
    return false;
}

bool awaitRelease(const std::string& aside) {
    constexpr seconds kPatience{30};
    const Clock::time_point start = Clock::now();
    bool told = false;
    while (!isReleased(aside)) {
        if (Clock::now() - start > kPatience) {
            return false;
        }
        told = told || SyslogngHupSignalSend() == 0;
        (void)usleep(kMoment);
    }
    return true;
}

// What came behind `newest` since the exchange. False when it may be in the former database only.
bool bringLast(const std::string& aside, uint64_t newest, const std::string& db) try {
    if (!awaitRelease(aside)) {
        return false;
    }
    if (newestOf(*OpenSource(aside)) > newest) {
        AppendRows(aside, newest, db);
    }
    return true;
} catch (const Failure&) {
    return false;
}

bool isDamaged(const std::string& db) try {
    (void)newestOf(*OpenSource(db));
    return false;
} catch (const Failure& failure) {
    if (failure.cause() != Cause::Damaged) {
        throw;
    }
    return true;
}

// The last row of the draft that counts as counted.
uint64_t countedOf(const std::string& draft, bool foreignCounted) {
    const auto source = OpenSource(draft);
    const uint64_t newest = newestOf(*source);
    const std::optional<uint64_t> counted = CountedUpTo(*source);
    return counted ? std::min(*counted, newest) : foreignCounted ? newest : 0;
}

void prepare(const std::string& draft, const std::string& db, Fill fill, bool foreignCounted) {
    const auto live = OpenSource(db);
    awaitCounts(*live);
    if (newestOf(*live) != 0) {
        addColumns(draft, db);
    }
    if (fill == Fill::Newer) {
        addNewer(draft, db);
    }
    stamp(draft, countedOf(draft, foreignCounted));
    finishFile(draft, db, true);
}

void replaceMissing(const std::string& draft, const std::string& db, bool foreignCounted) {
    stamp(draft, countedOf(draft, foreignCounted));
    finishFile(draft, std::filesystem::path(db).parent_path(), false);
    RemoveCompanions(db);
    place(draft, db, "");
    (void)SyslogngHupSignalSend();  // it may not run, or write a file that was removed
}

}  // namespace

Exchanged Exchange(const std::string& draft, const std::string& db, const std::string& label, Fill fill,
                   bool foreignCounted) {
    const SignalsHeld held;
    Exchanged done;
    if (!isThere(db)) {
        replaceMissing(draft, db, foreignCounted);
        done.complete = true;
        return done;
    }
    done.damaged = isDamaged(db);
    if (done.damaged && fill == Fill::Newer) {
        throw Failure(db + " is damaged; run quorlog db check on it", Cause::Damaged);
    }
    done.aside = freeName(db, label);
    if (done.damaged) {
        stamp(draft, countedOf(draft, foreignCounted));
        finishFile(draft, db, true);
        moveAside(db, done.aside);
        place(draft, db, done.aside);
        done.complete = SyslogngHupSignalSend() == 0;
        return done;
    }
    Freeze frozen(db);
    prepare(draft, db, fill, foreignCounted);
    const uint64_t newest = newestOf(*OpenSource(db));
    moveAside(db, done.aside);
    place(draft, db, done.aside);
    frozen.end();
    done.complete = bringLast(done.aside, newest, db);
    return done;
}

}  // namespace quor::store
