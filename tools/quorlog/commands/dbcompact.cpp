// db compact.
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include "base/paths.h"
#include "store/databasefile.h"
#include "store/exchange.h"
#include "store/merge.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/snapshot.h"

namespace quor::cli {
namespace {

struct CompactOptions {
    std::string db = paths::kWorkingDb;
    bool yes = false;
};

void setup(CLI::App& command, CompactOptions& options) {
    AddDatabaseOption(command, options.db);
    AddYesOption(command, options.yes);
}

std::string megabytes(uint64_t bytes) {
    return std::to_string((bytes + (uint64_t{1} << 20) - 1) >> 20) + " MiB";
}

// Not one file is left without a name when something failed: the former one stays then.
int report(const store::Exchanged& done, const std::string& db, uint64_t before) {
    if (!done.complete) {
        return ReportIncomplete(done.aside);
    }
    (void)unlink(done.aside.c_str());
    const std::string sizes = db + " took " + megabytes(before) + " and takes " + megabytes(store::WholeSizeOf(db));
    WriteLine(sizes);
    RecordDeed("Compacted " + sizes);
    return kDone;
}

int run(const CompactOptions& options) {
    const std::string db = store::RequireReplaceable(store::RequireLogDatabase(options.db));
    const store::FolderLock alone(db);
    RemoveDrafts(db);
    store::RequireSoundLogs(db);
    const uint64_t before = store::WholeSizeOf(db);
    const uint64_t free = store::FreeBytes(db);
    const uint64_t needed = before - std::min(before, free);
    if (free == 0) {
        return ReportNothing(db + " has no free pages to give back");
    }
    store::RequireRoom(std::filesystem::path(db).parent_path(), needed, "the compacted copy",
                       "delete more rows first, or copy it with quorlog backup to another disk");
    if (!options.yes &&
        !Confirm("Copy " + db + " without its " + megabytes(free) + " of free pages? That takes " + megabytes(needed) +
                 " of disk until the copy is in its place, and syslog-ng waits for "
                 "some seconds at the end.")) {
        Complain("nothing compacted");
        return kNothing;
    }
    const Draft draft(db);
    if (CopyDatabase(db, draft.path()) != kDone) {
        Complain("nothing compacted");
        return kFailed;
    }
    return report(Exchange(draft.path(), db, "before-compact", store::Fill::Newer, false), db, before);
}

}  // namespace

void AddDbCompact(CLI::App& db, int& status) {
    AddCommand<CompactOptions>(db, "compact", "Give the space of deleted rows back, also while it is in use", status,
                               setup, run);
}

}  // namespace quor::cli
