// The commands below "rules", by file.
#ifndef QUORLOG_COMMANDS_RULECOMMANDS_H
#define QUORLOG_COMMANDS_RULECOMMANDS_H

#include <CLI/CLI.hpp>

namespace quor::cli {

void AddRuleChanges(CLI::App& parent, int& status);
void AddRuleTests(CLI::App& parent, int& status);

}  // namespace quor::cli

#endif
