// values and names: what a filter can be given.
#include <iostream>
#include <map>

#include "ask.h"
#include "commands.h"
#include "common/paths.h"
#include "database.h"
#include "options.h"
#include "records.h"
#include "text.h"

namespace quor::cli {
namespace {

struct ValuesOptions {
    std::string db = paths::kWorkingDb;
    std::string attribute;
    OutputOptions output;
    uint64_t limit = 0;
    uint64_t offset = 0;
};

void setupValues(CLI::App& command, ValuesOptions& options) {
    command.add_option("attribute", options.attribute, "Column of table logs: host, prog, fac, prio, ...")
        ->type_name("ATTR")
        ->required();
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "--limit", options.limit, "Values wanted, 0 for all");
    AddNumberOption(command, "--offset", options.offset, "Values skipped");
}

int nothing(const std::string& db) {
    std::cerr << "quorlog: nothing found: no value in " << Visible(db) << '\n';
    return kNothing;
}

int runValues(const ValuesOptions& options) {
    std::string attribute = options.attribute;
    const _SYSLOG_DB_ATTRI_tag type = LogAttriType(attribute);
    if (type == SYSLOG_ATTRI_NONE || !HasColumn("logs", type)) {
        throw Failure("table logs has no column '" + Visible(attribute) +
                      "'; give host, ip, fac, prio, tag, prog, ldate, ltime, tzoffset, utcsec, id or msg");
    }
    std::string db = RequireLogDatabase(options.db);
    std::list<std::string> values;
    _SYSLOG_SQL_LIMIT_tag limit{options.limit, options.offset};
    if (SyslogDBAttriValueGet(db, attribute, &limit, values) < 0) {
        (void)Ask(db, "SELECT " + attribute + " FROM logs LIMIT 1", attribute.c_str());
        throw Failure("cannot read the values from " + Visible(db) + "; try again");
    }
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{LogAttriStrGet(type)}}, out);
    for (const std::string& value : values) {
        sink->row({value});
    }
    sink->finish();
    return values.empty() ? nothing(db) : kDone;
}

struct NamesOptions {
    std::string db = paths::kWorkingDb;
    std::string kind;
    OutputOptions output;
};

const std::map<std::string, _SYSLOG_EXTKEY_TB_TYPE_tag> kKinds = {
    {"host", SYSLOG_EXTKEY_HOST}, {"prog", SYSLOG_EXTKEY_PROG}, {"tag", SYSLOG_EXTKEY_TAG}, {"fac", SYSLOG_EXTKEY_FAC}};

void setupNames(CLI::App& command, NamesOptions& options) {
    command.add_option("kind", options.kind, "host, prog, tag or fac")
        ->type_name("KIND")
        ->required()
        ->check(CLI::IsMember({"host", "prog", "tag", "fac"}));
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
}

int runNames(const NamesOptions& options) {
    std::string db = RequireLogDatabase(options.db);
    std::map<unsigned long long, std::string> names;
    if (SyslogDBExtkeyMapGet(db, kKinds.at(options.kind), names) < 0) {
        RequireTable(db, "logs");
        throw Failure("cannot read the names from " + Visible(db) + "; run quorlog db check on it");
    }
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"key", Kind::Number}, {"name"}}, out);
    for (const auto& [key, name] : names) {
        sink->row({std::to_string(key), name});
    }
    sink->finish();
    return names.empty() ? nothing(db) : kDone;
}

}  // namespace

void AddValues(CLI::App& app, int& status) {
    AddCommand<ValuesOptions>(app, "values", "List the distinct values of a column", status, setupValues, runValues);
    AddCommand<NamesOptions>(app, "names", "List host, program, tag or facility names", status, setupNames, runNames);
}

}  // namespace quor::cli
