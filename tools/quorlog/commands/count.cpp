// count.
#include <unistd.h>

#include <algorithm>
#include <ctime>

#include "base/paths.h"
#include "store/groups.h"
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
    std::string by;
    uint64_t limit = 0;
};

void setup(CLI::App& command, CountOptions& options) {
    AddDatabaseOption(command, options.db);
    AddTableOption(command, options.table);
    AddFilterOptions(command, options.filters, true);
    AddOutputOptions(command, options.output);
    CLI::Option* by =
        command.add_option("--by", options.by, "Count each host, program, level, facility, hour, day or message apart")
            ->type_name("NAME")
            ->check(CLI::IsMember(std::vector<std::string>(store::kGroupings.begin(), store::kGroupings.end())));
    AddNumberOption(command, "-n,--limit", options.limit, "Groups to show, 0 for all")->needs(by);
    command
        .add_flag("--estimate", options.estimate,
                  "Print the largest id instead: immediate, but too large after deletions")
        ->excludes(by);
}

int runBy(const CountOptions& options, const store::Source& source, const store::Selection& selection) {
    std::vector<store::Group> groups = CountBy(source, selection, options.by);
    if (options.limit != 0 && groups.size() > options.limit) {
        groups.resize(static_cast<size_t>(options.limit));
    }
    uint64_t most = 0;
    for (const store::Group& group : groups) {
        most = std::max(most, group.rows);
    }
    const Style style = options.output.style();
    const bool bars = style.format == Format::Table && style.terminal;
    Columns columns = {{"count", Kind::Number}, {options.by.c_str()}};
    if (bars) {
        columns.insert(columns.begin() + 1, {""});
    }
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(style, std::move(columns), out);
    for (const store::Group& group : groups) {
        const std::string count = std::to_string(group.rows);
        const std::string bar = bars ? Bar(style, group.rows, most) : "";
        sink->row(bars ? Cells{count, bar, group.name} : Cells{count, group.name});
    }
    sink->finish();
    return groups.empty() ? ReportNothing(WhyNothing(source, selection, options.filters, 0)) : kDone;
}

int run(const CountOptions& options) {
    store::Selection selection;
    selection.table = options.table;
    selection.filter = BuildFilter(options.filters, options.table, time(nullptr));
    const auto source = store::OpenSource(options.db);
    if (!options.by.empty()) {
        return runBy(options, *source, selection);
    }
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
