#include "tools/quorlog/commands/commands.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <iterator>

#include "base/paths.h"
#include "tools/quorlog/usage.h"

namespace quor::cli {
namespace {

struct Command {
    std::string_view name;
    void (*add)(CLI::App& app, int& status);
};

// In the order in which help names them.
constexpr Command kCommands[] = {
    {"search", AddSearch}, {"count", AddCount},     {"delete", AddDelete},   {"values", AddValues}, {"names", AddNames},
    {"stats", AddStats},   {"events", AddEvents},   {"rules", AddRules},     {"notify", AddNotify}, {"db", AddDb},
    {"backup", AddBackup}, {"restore", AddRestore}, {"archive", AddArchive}, {"doctor", AddDoctor}, {"parse", AddParse},
};

}  // namespace

void AddCommands(CLI::App& app, int& status, std::string_view only) {
    app.description("Searches, counts and manages the logs that syslog-ng writes to databases.");
    app.footer(std::string("The logs are in ") + paths::kWorkingDb + " unless --db says otherwise.\n" +
               "Exit status: 0 found or done, 1 nothing found, 2 wrong usage or failure.\n"
               "Options of a command: quorlog COMMAND --help. All about them: man quorlog");
    app.formatter(MakeHelp());
    app.require_subcommand(1);
    app.set_help_all_flag("--help-all", "Print the options of every command");
    const auto* chosen =
        std::find_if(std::begin(kCommands), std::end(kCommands), [&](const auto& each) { return each.name == only; });
    for (const auto& command : kCommands) {
        if (chosen == std::end(kCommands) || &command == chosen) {
            command.add(app, status);
        }
    }
}

}  // namespace quor::cli
