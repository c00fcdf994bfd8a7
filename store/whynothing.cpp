#include "store/whynothing.h"

#include <ctime>

#include "base/numbers.h"

namespace quor::store {

std::string WhyNothing(const Source& source, const Selection& selection, const FilterOptions& options, uint64_t below) {
    const auto none = [&](const Conditions& conditions) { return !AnyRow(source, selection.table, conditions); };
    if (none({})) {
        return "table " + selection.table + " is empty";
    }
    if (below != 0 && none({{IdCondition(SYSLOG_OP_BELOW, below)}, {}})) {
        return "no row has an id below " + Decimal(below);
    }
    const std::vector<Probe> probes = BuildProbes(options, selection.table, time(nullptr));
    for (const Probe& probe : probes) {
        if (none(probe.conditions)) {
            return "no row " + probe.words;
        }
    }
    if (selection.offset != 0 && !none(selection.filter.conditions)) {
        return "--offset is beyond the last row";
    }
    return probes.empty() ? "no message matches" : "no row matches all filters together";
}

}  // namespace quor::store
