#include "tools/quorlog/commands/commands.h"

#include <CLI/CLI.hpp>

namespace quor::cli {
namespace {

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

void AddCommands(CLI::App& app, int& status) {
    app.description("Searches, counts and manages the logs that syslog-ng writes to databases.");
    app.footer("Exit status: 0 found or done, 1 nothing found, 2 wrong usage or failure.");
    app.formatter(std::make_shared<WholeHelp>());
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
    AddBackup(app, status);
    AddDoctor(app, status);
    AddParse(app, status);
}

}  // namespace quor::cli
