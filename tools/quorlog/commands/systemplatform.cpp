// In place of the commands that need the bundled platform libraries, where the appliance's own are linked.
#include "tools/quorlog/commands/commands.h"

namespace quor::cli {

void AddArchive(CLI::App& /*app*/, int& /*status*/) {}
void AddNotify(CLI::App& /*app*/, int& /*status*/) {}
void AddDbSalvage(CLI::App& /*db*/, int& /*status*/) {}

}  // namespace quor::cli
