// values: what there is to filter by.
#include <unistd.h>

#include <algorithm>
#include <set>

#include "base/paths.h"
#include "store/columns.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct ValuesOptions {
    std::string db = paths::kWorkingDb;
    std::string attribute;
    OutputOptions output;
    uint64_t limit = 0;
    uint64_t offset = 0;
    uint64_t newest = 0;
};

void setup(CLI::App& command, ValuesOptions& options) {
    command.add_option("attribute", options.attribute, "Column of table logs: host, program, facility, level, ...")
        ->type_name("ATTR")
        ->required();
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of values, 0 for all");
    AddNumberOption(command, "--offset", options.offset, "Number of values to skip");
    AddNumberOption(command, "--newest", options.newest, "Look at so many rows only: quick in a large table");
}

// The name in the database.
std::string columnOf(const std::string& name) {
    const std::vector<store::Column> all = store::ColumnsOf("logs", false);
    const auto found = std::find_if(all.begin(), all.end(), [&](const auto& column) { return column.title == name; });
    return found == all.end() ? name : found->name;
}

std::list<std::string> valuesOf(const ValuesOptions& options, const store::Source& source,
                                _SYSLOG_DB_ATTRI_tag attribute) {
    if (options.newest == 0) {
        return source.values(attribute, {options.limit, options.offset});
    }
    const uint64_t largest = LargestId(source, "logs");
    const store::Conditions newest = {
        {store::IdCondition(SYSLOG_OP_ABOVE, largest - std::min(largest, options.newest))}, {}};
    std::set<std::string> sorted;
    source.groups("logs", newest, LogAttriStrGet(attribute),
                  [&](std::string_view name, uint64_t) { sorted.emplace(name); });
    std::list<std::string> values;
    uint64_t seen = 0;
    for (const std::string& name : sorted) {
        const bool wanted = seen++ >= options.offset && (options.limit == 0 || values.size() < options.limit);
        values.insert(values.end(), wanted ? 1 : 0, name);
    }
    return values;
}

int run(const ValuesOptions& options) {
    const _SYSLOG_DB_ATTRI_tag attribute = LogAttriType(columnOf(options.attribute));
    if (attribute == SYSLOG_ATTRI_NONE || !store::HasColumn("logs", LogAttriStrGet(attribute))) {
        throw Failure("table logs has no column '" + options.attribute +
                      "'; give host, ip, facility, level, tag, program, date, time, zone, sent, id or message");
    }
    const auto source = store::OpenSource(options.db);
    const std::list<std::string> values = valuesOf(options, *source, attribute);
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{LogAttriStrGet(attribute)}}, out);
    for (const std::string& value : values) {
        sink->row({value});
    }
    sink->finish();
    return values.empty() ? ReportNothing("no values in " + source->name()) : kDone;
}

}  // namespace

void AddValues(CLI::App& app, int& status) {
    AddCommand<ValuesOptions>(app, "values", "List the distinct values of a column", status, setup, run);
}

}  // namespace quor::cli
