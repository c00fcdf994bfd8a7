// names: hosts, programs, tags and facilities with their keys.
#include <unistd.h>

#include <map>

#include "base/paths.h"
#include "dbutil.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct NamesOptions {
    std::string db = paths::kWorkingDb;
    std::string kind;
    OutputOptions output;
};

const std::map<std::string, _SYSLOG_EXTKEY_TB_TYPE_tag> kKinds = {
    {"host", SYSLOG_EXTKEY_HOST}, {"prog", SYSLOG_EXTKEY_PROG}, {"tag", SYSLOG_EXTKEY_TAG}, {"fac", SYSLOG_EXTKEY_FAC}};

void setup(CLI::App& command, NamesOptions& options) {
    command.add_option("kind", options.kind, "host, prog, tag or fac")
        ->type_name("KIND")
        ->required()
        ->check(CLI::IsMember({"host", "prog", "tag", "fac"}));
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
}

int run(const NamesOptions& options) {
    std::string db = store::RequireLogDatabase(options.db);
    std::map<unsigned long long, std::string> names;
    if (SyslogDBExtkeyMapGet(db, kKinds.at(options.kind), names) < 0) {
        (void)store::Ask(db, "SELECT " + options.kind + " FROM logs LIMIT 1", options.kind.c_str());
        throw Failure("cannot read the names from " + db + "; run quorlog db check on it", store::Cause::Other);
    }
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"key", Kind::Number}, {"name"}}, out);
    for (const auto& [key, name] : names) {
        sink->row({std::to_string(key), name});
    }
    sink->finish();
    return names.empty() ? ReportNothing("no names in " + db) : kDone;
}

}  // namespace

void AddNames(CLI::App& app, int& status) {
    AddCommand<NamesOptions>(app, "names", "List host, program, tag or facility names", status, setup, run);
}

}  // namespace quor::cli
