// db merge.
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include "base/paths.h"
#include "store/databasefile.h"
#include "store/merge.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct MergeOptions {
    std::string from;
    std::string into = paths::kWorkingDb;
};

void setup(CLI::App& command, MergeOptions& options) {
    command.add_option("from", options.from, "The database whose rows are added")->type_name("PATH")->required();
    command.add_option("--into", options.into, "The database that gets them")->type_name("PATH")->capture_default_str();
}

void showProgress(uint64_t part, uint64_t parts) {
    if (isatty(STDERR_FILENO) != 0) {
        (void)fprintf(stderr, "\rpart %llu of %llu%s", static_cast<unsigned long long>(part),
                      static_cast<unsigned long long>(parts), part == parts ? "\n" : "");
    }
}

int run(const MergeOptions& options) {
    const std::string from = store::RequireDatabase(options.from, "name the file whose rows are to be added");
    const std::string into = store::RequireLogDatabase(options.into);
    if (std::filesystem::equivalent(from, into)) {
        throw Failure(from + " and " + into + " are the same file; give another one");
    }
    const store::FolderLock alone(into);
    const std::string folder = std::filesystem::path(into).parent_path();
    constexpr uint64_t kMostTemporary = uint64_t{256} << 20;
    const uint64_t size = store::WholeSizeOf(from);
    const uint64_t temporary = std::min(kMostTemporary, 2 * (size + store::WholeSizeOf(into)));
    store::RequireRoom(folder, size + temporary, "the merge", "make room there");
    (void)setenv("SQLITE_TMPDIR", folder.c_str(), 0);  // there is room for it, and /tmp may be memory
    const store::Merged merged = store::MergeRows(from, into, showProgress);
    const std::string rows = std::to_string(merged.added) + (merged.added == 1 ? " row" : " rows");
    WriteLine("added " + rows + " to " + into + "; " + std::to_string(merged.there) + " were there already");
    if (merged.added != 0) {
        RecordDeed("Merged " + rows + " of " + from + " into " + into);
    }
    return kDone;
}

}  // namespace

void AddDbMerge(CLI::App& db, int& status) {
    AddCommand<MergeOptions>(db, "merge", "Add the rows that another database has, such as a salvaged one", status,
                             setup, run);
}

}  // namespace quor::cli
