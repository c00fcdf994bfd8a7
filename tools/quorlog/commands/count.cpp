// count.
#include <unistd.h>

#include <ctime>

#include "base/paths.h"
#include "store/selection.h"
#include "store/whynothing.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct CountOptions {
    std::string db = paths::kWorkingDb;
    std::string table = "logs";
    store::FilterOptions filters;
    OutputOptions output;
    bool estimate = false;
};

void setup(CLI::App& command, CountOptions& options) {
    AddDatabaseOption(command, options.db);
    AddTableOption(command, options.table);
    AddFilterOptions(command, options.filters);
    AddOutputOptions(command, options.output);
    command.add_flag("--estimate", options.estimate,
                     "Print the largest id instead: immediate, but too large after deletions");
}

int run(const CountOptions& options) {
    store::Selection selection;
    selection.table = options.table;
    selection.filter = BuildFilter(options.filters, options.table, time(nullptr));
    const auto source = store::OpenSource(options.db);
    if (options.estimate && !selection.filter.conditions.empty()) {
        throw Failure("--estimate counts the whole table; leave out the filters or --estimate");
    }
    const uint64_t count = options.estimate ? LargestId(*source, options.table) : Count(*source, selection);
    const Style style = options.output.style();
    if (style.format == Format::Table) {
        WriteLine(std::to_string(count));
    } else {
        Output out(STDOUT_FILENO);
        WriteRecord(style, {{"count", std::to_string(count), Kind::Number}}, out);
    }
    return count == 0 ? ReportNothing(WhyNothing(*source, selection, options.filters, 0)) : kDone;
}

}  // namespace

void AddCount(CLI::App& app, int& status) {
    AddCommand<CountOptions>(app, "count", "Count log rows", status, setup, run);
}

}  // namespace quor::cli
