// restore.
#include <filesystem>

#include "base/paths.h"
#include "store/databasefile.h"
#include "store/exchange.h"
#include "store/merge.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/snapshot.h"

namespace quor::cli {
namespace {

struct RestoreOptions {
    std::string db = paths::kWorkingDb;
    std::string file;
    bool yes = false;
};

void setup(CLI::App& command, RestoreOptions& options) {
    command.add_option("file", options.file, "The backup")->type_name("PATH")->required();
    AddDatabaseOption(command, options.db);
    AddYesOption(command, options.yes);
}

std::string rowsIn(const std::string& file) {
    const uint64_t rows = Count(*store::OpenSource(file), {});
    return std::to_string(rows) + (rows == 1 ? " row" : " rows");
}

bool isAgreed(const RestoreOptions& options, const std::string& backup, const std::string& db) {
    const bool replaces = std::filesystem::exists(db);
    const std::string present = replaces ? " in the place of " + db + ", which is kept beside it?" : " at " + db + "?";
    return options.yes || Confirm("Put " + backup + " with " + rowsIn(backup) + present);
}

// What is left to do when not all went as it should.
int report(const store::Exchanged& done, const std::string& db) {
    WriteLine("restored " + rowsIn(db) + " in " + db);
    if (!done.aside.empty()) {
        WriteLine("the former database is " + done.aside);
    }
    if (done.damaged) {
        WriteLine(
            "it is damaged: quorlog db salvage saves its rows in a new file, and quorlog db merge adds those here");
    } else if (done.complete && !done.aside.empty()) {
        WriteLine("to add its rows: quorlog db merge " + done.aside);
    }
    if (done.damaged && !done.complete) {
        Complain("syslog-ng could not be told; if it runs, restart it");
        return kFailed;
    }
    return done.complete ? kDone : ReportIncomplete(done.aside);
}

int run(const RestoreOptions& options) {
    const std::string backup = store::RequireDatabase(options.file, "give a file that quorlog backup made");
    const std::string db = store::RequireReplaceable(options.db);
    if (std::filesystem::exists(db) && std::filesystem::equivalent(backup, db)) {
        throw Failure(backup + " is the database itself; give a backup of it");
    }
    store::RequireSoundLogs(backup);
    if (!isAgreed(options, backup, db)) {
        Complain("nothing restored");
        return kNothing;
    }
    const store::FolderLock alone(db);
    RemoveDrafts(db);
    store::RequireRoom(std::filesystem::path(db).parent_path(), store::WholeSizeOf(backup), "the restored database",
                       "make room there");
    const Draft draft(db);
    if (CopyDatabase(backup, draft.path()) != kDone) {
        Complain("nothing restored");
        return kFailed;
    }
    store::RequireSoundLogs(draft.path());  // the backup may be another file by now
    store::RequireWritableLogs(draft.path());
    const store::Exchanged done = Exchange(draft.path(), db, "before-restore", store::Fill::Nothing, true);
    RecordDeed("Restored " + db + " from " + backup +
               (done.aside.empty() ? "" : "; the former database is " + done.aside));
    return report(done, db);
}

}  // namespace

void AddRestore(CLI::App& app, int& status) {
    AddCommand<RestoreOptions>(app, "restore", "Put a backup in the place of the log database, also while it is in use",
                               status, setup, run);
}

}  // namespace quor::cli
