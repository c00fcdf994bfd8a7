// delete.
#include <ctime>
#include <iostream>

#include "commands.h"
#include "common/paths.h"
#include "database.h"
#include "options.h"
#include "selection.h"
#include "text.h"

namespace quor::cli {
namespace {

struct DeleteOptions {
    std::string db = paths::kWorkingDb;
    FilterOptions filters;
    bool all = false;
    bool yes = false;
};

void setup(CLI::App& command, DeleteOptions& options) {
    AddDatabaseOption(command, options.db);
    AddFilterOptions(command, options.filters);
    command.add_flag("--all", options.all, "Delete every row: needed when there is no filter");
    AddYesOption(command, options.yes);
}

// A deletion has to say what it means: an empty filter is a slip more often than a wish.
Selection selectionOf(const DeleteOptions& options) {
    Selection selection{{}, "logs", BuildFilter(options.filters, "logs", time(nullptr))};
    const bool filtered = !selection.filter.conditions.empty();
    if (!selection.filter.literal.empty()) {
        throw Failure("--keyword: rows cannot be deleted by a text with * or ?, or one that is no UTF-8; give --glob, "
                      "where * and ? match any text");
    }
    if (filtered == options.all) {
        throw Failure(filtered ? "--all deletes every row; leave out the filters or --all"
                               : "no filter was given; give one, or --all to delete every row");
    }
    selection.db = RequireLogDatabase(options.db);
    return selection;
}

int run(const DeleteOptions& options) {
    Selection selection = selectionOf(options);
    const std::string count = std::to_string(Count(selection));
    if (count == "0") {
        std::cerr << "quorlog: nothing found: no row matches\n";
        return kNothing;
    }
    if (!options.yes && !Confirm("Delete " + count + " rows from " + Visible(selection.db) + "?")) {
        std::cerr << "quorlog: nothing deleted\n";
        return kNothing;
    }
    if (SyslogDBDelete(selection.db, selection.filter.conditions) < 0) {
        throw Failure("cannot delete from " + Visible(selection.db) + "; see that you may write it, and try again");
    }
    WriteLine("deleted " + count + " rows");
    return kDone;
}

}  // namespace

void AddDelete(CLI::App& app, int& status) {
    AddCommand<DeleteOptions>(app, "delete", "Delete rows of table logs", status, setup, run);
}

}  // namespace quor::cli
