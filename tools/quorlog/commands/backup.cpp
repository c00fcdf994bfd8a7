// backup.
#include <sys/stat.h>

#include <filesystem>

#include "base/paths.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/snapshot.h"

namespace quor::cli {
namespace {

struct BackupOptions {
    std::string db = paths::kWorkingDb;
    std::string file;
};

void setup(CLI::App& command, BackupOptions& options) {
    command.add_option("file", options.file, "The file to create")->type_name("PATH")->required();
    AddDatabaseOption(command, options.db);
}

int run(const BackupOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    const std::string target = store::AbsolutePath(options.file);
    struct stat there {};
    if (lstat(target.c_str(), &there) == 0) {
        throw Failure(target + " exists already; move it away or give another file");
    }
    store::RequireRoom(std::filesystem::path(target).parent_path(), store::WholeSizeOf(db), "the backup",
                       "give a file on another disk");
    store::RequireTable(db, "logs");
    const Draft draft(target);
    if (CopyDatabase(db, draft.path()) != kDone) {
        Complain("no backup was made");
        return kFailed;
    }
    if (store::Ask(draft.path(), "PRAGMA quick_check", "quick_check") != std::vector<std::string>{"ok"}) {
        throw Failure("the backup is not sound; run quorlog db check on " + db, store::Cause::Damaged);
    }
    const uint64_t rows = Count(*store::OpenSource(draft.path()), {});
    draft.finish();
    WriteLine("saved " + std::to_string(rows) + (rows == 1 ? " row in " : " rows in ") + target);
    RecordDeed("Backed up " + db + " to " + target);
    return kDone;
}

}  // namespace

void AddBackup(CLI::App& app, int& status) {
    AddCommand<BackupOptions>(app, "backup", "Copy the log database, as it is now, while it is in use", status, setup,
                              run);
}

}  // namespace quor::cli
