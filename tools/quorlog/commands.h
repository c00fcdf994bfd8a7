// Every command adds itself to the program; the chosen one runs while the command line is parsed.
#ifndef QUORLOG_COMMANDS_H
#define QUORLOG_COMMANDS_H

namespace CLI {
class App;
}

namespace quor::cli {

void AddSearch(CLI::App& app, int& status);
void AddCount(CLI::App& app, int& status);
void AddDelete(CLI::App& app, int& status);
void AddDb(CLI::App& app, int& status);
void AddSalvage(CLI::App& db, int& status);

// All of them.
void AddCommands(CLI::App& app, int& status);

}  // namespace quor::cli

#endif
