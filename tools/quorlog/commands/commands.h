// Every command adds itself to the program; the chosen one runs while the command line is parsed.
#ifndef QUORLOG_COMMANDS_COMMANDS_H
#define QUORLOG_COMMANDS_COMMANDS_H

#include <string_view>

namespace CLI {
class App;
}

namespace quor::cli {

void AddSearch(CLI::App& app, int& status);
void AddCount(CLI::App& app, int& status);
void AddDelete(CLI::App& app, int& status);
void AddValues(CLI::App& app, int& status);
void AddNames(CLI::App& app, int& status);
void AddStats(CLI::App& app, int& status);
void AddEvents(CLI::App& app, int& status);
void AddRules(CLI::App& app, int& status);
void AddNotify(CLI::App& app, int& status);
void AddDb(CLI::App& app, int& status);
void AddBackup(CLI::App& app, int& status);
void AddRestore(CLI::App& app, int& status);
void AddArchive(CLI::App& app, int& status);
void AddDoctor(CLI::App& app, int& status);
void AddParse(CLI::App& app, int& status);

// Below db.
void AddDbCheck(CLI::App& db, int& status);
void AddDbCompact(CLI::App& db, int& status);
void AddDbMerge(CLI::App& db, int& status);
void AddDbSalvage(CLI::App& db, int& status);

// All of them, or the command of this name alone, when there is one: adding all takes longer than a search.
void AddCommands(CLI::App& app, int& status, std::string_view only = {});

}  // namespace quor::cli

#endif
