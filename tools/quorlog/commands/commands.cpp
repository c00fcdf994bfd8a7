#include "tools/quorlog/commands/commands.h"

#include <CLI/CLI.hpp>
#include <algorithm>
#include <iterator>

namespace quor::cli {
namespace {

struct Command {
    std::string_view name;
    void (*add)(CLI::App& app, int& status);
};

// In the order in which help names them.
constexpr Command kCommands[] = {
    {"search", AddSearch}, {"count", AddCount},   {"delete", AddDelete}, {"values", AddValues}, {"names", AddNames},
    {"stats", AddStats},   {"events", AddEvents}, {"rules", AddRules},   {"notify", AddNotify}, {"db", AddDb},
    {"backup", AddBackup}, {"doctor", AddDoctor}, {"parse", AddParse},
};

// Help on every command: the parser's own stops at groups such as stats.
class WholeHelp : public CLI::Formatter {
  public:
    std::string make_expanded(const CLI::App* command) const override {
        std::string help = CLI::Formatter::make_expanded(command);
        for (const CLI::App* sub : command->get_subcommands([](const CLI::App*) { return true; })) {
            help += "\n" + command->get_name() + " " + make_expanded(sub);
        }
        return help;
    }
};

}  // namespace

void AddCommands(CLI::App& app, int& status, std::string_view only) {
    app.description("Searches, counts and manages the logs that syslog-ng writes to databases.");
    app.footer("Exit status: 0 found or done, 1 nothing found, 2 wrong usage or failure.");
    app.formatter(std::make_shared<WholeHelp>());
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
