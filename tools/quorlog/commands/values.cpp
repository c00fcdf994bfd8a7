// values: what there is to filter by.
#include <unistd.h>

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
};

void setup(CLI::App& command, ValuesOptions& options) {
    command.add_option("attribute", options.attribute, "Column of table logs: host, prog, fac, prio, ...")
        ->type_name("ATTR")
        ->required();
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of values, 0 for all");
    AddNumberOption(command, "--offset", options.offset, "Number of values to skip");
}

int run(const ValuesOptions& options) {
    const _SYSLOG_DB_ATTRI_tag attribute = LogAttriType(options.attribute);
    if (attribute == SYSLOG_ATTRI_NONE || !store::HasColumn("logs", LogAttriStrGet(attribute))) {
        throw Failure("table logs has no column '" + options.attribute +
                      "'; give host, ip, fac, prio, tag, prog, ldate, ltime, tzoffset, utcsec, id or msg");
    }
    const auto source = store::OpenSource(options.db);
    const std::list<std::string> values = source->values(attribute, {options.limit, options.offset});
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
