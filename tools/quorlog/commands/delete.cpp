// delete.
#include <ctime>

#include "base/paths.h"
#include "store/selection.h"
#include "store/whynothing.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct DeleteOptions {
    std::string db = paths::kWorkingDb;
    store::FilterOptions filters;
    bool all = false;
    bool yes = false;
};

void setup(CLI::App& command, DeleteOptions& options) {
    AddDatabaseOption(command, options.db);
    AddFilterOptions(command, options.filters, false);
    command.add_flag("--all", options.all, "Delete every row; needed when no filter is given");
    AddYesOption(command, options.yes);
}

// A deletion has to say what it means: an empty filter is a slip more often than a wish.
void checkNames(const store::FilterOptions& filters) {
    for (const store::Names* names : {&filters.host, &filters.level, &filters.facility, &filters.program, &filters.pid,
                                      &filters.msgid, &filters.ip}) {
        if (!names->empty() && store::NamesOf(*names, "", false).empty()) {
            throw Failure("'any' means every row; leave that filter out");
        }
    }
    for (const store::Names* names : {&filters.notHost, &filters.notFacility, &filters.notProgram}) {
        if (store::InWords(*names).find_first_of("*?") != std::string::npos) {
            throw Failure("rows cannot be kept by a name with * or ?, which stand for themselves here: '" +
                          store::InWords(*names) + "'; name each that is to be kept");
        }
    }
}

store::Filter filterOf(const DeleteOptions& options) {
    store::Filter filter = BuildFilter(options.filters, "logs", time(nullptr));
    checkNames(options.filters);
    const bool filtered = !filter.conditions.empty();
    if (!filter.literal.empty()) {
        throw Failure("--keyword: rows cannot be deleted by a text with * or ?, or one that is not UTF-8; give --glob, "
                      "where * and ? are wildcards");
    }
    if (filtered == options.all) {
        throw Failure(filtered ? "--all deletes every row; leave out the filters or --all"
                               : "no filter was given; give one, or --all to delete every row");
    }
    return filter;
}

int run(const DeleteOptions& options) {
    store::Selection selection;
    selection.filter = filterOf(options);
    const auto source = store::OpenSource(options.db);
    if (!options.all) {  // rows that arrive while somebody thinks about the question are not part of the answer
        selection.filter.conditions.attributes.push_back(
            store::IdCondition(SYSLOG_OP_AT_MOST, LargestId(*source, selection.table)));
    }
    const uint64_t count = Count(*source, selection);
    if (count == 0) {
        return ReportNothing(WhyNothing(*source, selection, options.filters, 0));
    }
    const std::string rows = std::to_string(count) + (count == 1 ? " row" : " rows");
    if (!options.yes && !Confirm("Delete " + rows + " from " + source->name() + "?")) {
        Complain("nothing deleted");
        return kNothing;
    }
    source->remove(selection.filter.conditions);
    WriteLine("deleted " + rows);
    RecordDeed("Deleted " + rows + " from " + source->name());
    return kDone;
}

}  // namespace

void AddDelete(CLI::App& app, int& status) {
    AddCommand<DeleteOptions>(app, "delete", "Delete rows of table logs", status, setup, run);
}

}  // namespace quor::cli
