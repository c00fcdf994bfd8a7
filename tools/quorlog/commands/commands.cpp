#include "tools/quorlog/commands/commands.h"

#include <CLI/CLI.hpp>

namespace quor::cli {

void AddCommands(CLI::App& app, int& status) {
    app.description("Searches, counts and manages the logs that syslog-ng writes to databases.");
    app.footer("Exit status: 0 found or done, 1 nothing found, 2 wrong usage or failure.");
    app.require_subcommand(1);
    app.set_help_all_flag("--help-all", "Print the options of every command");
    AddSearch(app, status);
    AddCount(app, status);
    AddDelete(app, status);
    AddValues(app, status);
    AddNames(app, status);
    AddStats(app, status);
    AddEvents(app, status);
    AddRules(app, status);
    AddNotify(app, status);
    AddDb(app, status);
    AddParse(app, status);
}

}  // namespace quor::cli
