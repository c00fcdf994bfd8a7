// db check, wal, limit: looking after the working database.
#include <fcntl.h>
#include <sys/stat.h>

#include <filesystem>

#include "base/guards.h"
#include "base/paths.h"
#include "dbhandler.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/merge.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/shellpath.h"

namespace quor::cli {
namespace {

struct CareOptions {
    std::string db = paths::kWorkingDb;
    uint64_t kilobytes = 0;
    bool full = false;
    bool yes = false;
};

void setupCheck(CLI::App& command, CareOptions& options) {
    AddDatabaseOption(command, options.db);
    command.add_flag("--full", options.full, "Compare indexes with their tables, too; much slower");
}

void setupWal(CLI::App& command, CareOptions& options) {
    AddDatabaseOption(command, options.db);
}

void setupLimit(CLI::App& command, CareOptions& options) {
    AddNumberOption(command, "kilobytes", options.kilobytes, "The largest size allowed")->required();
    AddDatabaseOption(command, options.db);
    AddYesOption(command, options.yes);
}

[[noreturn]] void failDamaged(const std::string& db) {
    throw Failure(db + " is damaged; stop syslog-ng, move the file away with its -wal and -shm, start "
                       "syslog-ng, and save its rows with quorlog db salvage",
                  store::Cause::Damaged);
}

// The pages of an archive may be sound, and what is in them not.
void requireReadableRows(const std::string& db) {
    if (store::Ask(db, "SELECT 1 FROM sqlite_schema WHERE name = 'logs' AND sql LIKE 'CREATE VIRTUAL%'", "1").empty()) {
        return;
    }
    std::string counts;
    for (const store::StoredColumn& column : store::StoredColumns(db)) {
        counts += (counts.empty() ? "SELECT count(" : ", count(") + column.name + ")";
    }
    (void)store::Ask(db, counts + " FROM logs", "");
}

std::vector<std::string> findings(const std::string& db, bool full) {
    const char* check = full ? "integrity_check" : "quick_check";
    try {
        std::vector<std::string> found = store::Ask(db, std::string("PRAGMA ") + check, check);
        requireReadableRows(db);
        return found;
    } catch (const Failure& failure) {
        if (failure.cause() != store::Cause::Damaged) {
            throw;
        }
        failDamaged(db);
    }
}

int runCheck(const CareOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    const std::vector<std::string> found = findings(db, options.full);
    if (found == std::vector<std::string>{"ok"}) {
        WriteLine(db + " is sound");
        return kDone;
    }
    for (const std::string& finding : found) {
        WriteLine(finding);
    }
    failDamaged(db);
}

int runWal(const CareOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    RequirePlainPath(db, Quoting::None);
    (void)SyslogngWorkingDbSetJouWal(db);  // its result is the shell's; the mode tells
    if (store::Ask(db, "PRAGMA journal_mode", "journal_mode") != std::vector<std::string>{"wal"}) {
        throw Failure("cannot switch " + db + " to a write-ahead log; try again when no program is using it",
                      store::Cause::Busy);
    }
    WriteLine(db + " now has a write-ahead log");
    return kDone;
}

int runLimit(const CareOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    store::RequireTable(db, "logs");  // nothing else is removed
    if (std::filesystem::is_symlink(db)) {
        throw Failure(db + " is a symbolic link; give the file that it leads to");
    }
    const uint64_t kilobytes = std::filesystem::file_size(db) / 1024;
    const std::string size = db + " takes " + std::to_string(kilobytes) + " KiB";
    if (options.kilobytes > INT32_MAX || kilobytes <= options.kilobytes) {
        WriteLine(size + ", which is allowed");
        return kDone;
    }
    if (!options.yes && !Confirm(size + ". Remove it with all its rows, and have syslog-ng start a new one?")) {
        Complain("nothing removed");
        return kNothing;
    }
    const Descriptor file(open(db.c_str(), O_RDONLY | O_CLOEXEC));
    struct stat before {};
    struct stat after {};
    (void)fstat(file.get(), &before);
    store::RemoveCompanions(db);
    if (SyslogngWorkingDbCheck(db, static_cast<int>(options.kilobytes)) < 0 || fstat(file.get(), &after) != 0 ||
        after.st_nlink >= before.st_nlink) {
        throw Failure("cannot remove " + db + "; make sure that you may write to its folder", store::Cause::Denied);
    }
    WriteLine("removed " + db);
    RecordDeed("Removed " + db + ", which had grown too large");
    if (SyslogngHupSignalSend() < 0) {  // once more: the check does not say whether it could
        Complain("syslog-ng could not be told; if it runs, restart it: it goes on writing to the removed file");
    }
    return kDone;
}

}  // namespace

void AddDbCheck(CLI::App& db, int& status) {
    AddCommand<CareOptions>(db, "check", "Check a database for damage", status, setupCheck, runCheck);
    AddCommand<CareOptions>(db, "wal", "Switch a database to a write-ahead log", status, setupWal, runWal);
    AddCommand<CareOptions>(db, "limit", "Remove a database that has grown too large", status, setupLimit, runLimit);
}

}  // namespace quor::cli
