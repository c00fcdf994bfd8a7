// In place of salvage.cpp where the appliance's own platform libraries, which cannot salvage, are linked.
#include "commands.h"

void quor::cli::AddSalvage(CLI::App& /*db*/, int& /*status*/) {}
