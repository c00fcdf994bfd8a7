#include "store/groups.h"

#include <algorithm>
#include <unordered_map>
#include <utility>

#include "store/columns.h"
#include "store/failure.h"
#include "store/shape.h"

namespace quor::store {
namespace {

// The name of a row's group: as the database computes it, and of a record at hand.
struct Grouping {
    const char* name;
    const char* column;  // that the table must have
    const char* expression;
    std::string (*of)(const Record& record);
};

std::string levelOf(const Record& record) {
    return PriorTypeToStr(record.prio);
}

// A row without a time of day has its day.
constexpr const char kHour[] = "ifnull(ldate, '') || iif(ltime > '', ' ' || substr(ltime, 1, 2) || ':00', '')";

std::string hourOf(const Record& record) {
    return record.ltime.empty() ? record.ldate : record.ldate + " " + record.ltime.substr(0, 2) + ":00";
}

constexpr Grouping kKnown[] = {
    {"host", "host", "host", [](const Record& record) { return record.host; }},
    {"program", "prog", "prog", [](const Record& record) { return record.prog; }},
    {"level", "llevel", "llevel", levelOf},
    {"facility", "fac", "fac", [](const Record& record) { return record.fac; }},
    {"hour", "ltime", kHour, hourOf},
    {"day", "ldate", "ldate", [](const Record& record) { return record.ldate; }},
    {"message", "msg", "shape(msg)",
     [](const Record& record) { return ShapeOf(record.msg.empty() ? record.event : record.msg); }},
};

const Grouping& groupingNamed(const std::string& name, const std::string& table) {
    const auto* found =
        std::find_if(std::begin(kKnown), std::end(kKnown), [&](const Grouping& each) { return each.name == name; });
    if (found == std::end(kKnown) || !HasColumn(table, found->column)) {
        throw Failure("--by " + name + ": table " + table + " has no such column; choose another one");
    }
    return *found;
}

// The library reads whatever is none of the levels as one of them.
std::string shownAs(const Grouping& how, std::string_view name) {
    std::string text(name);
    return std::string_view(how.column) == "llevel" ? PriorTypeToStr(PriorStrToType(text.c_str())) : text;
}

size_t severity(const std::string& level) {
    const auto* found = std::find(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), level);
    return static_cast<size_t>(found - std::begin(g_MappingSyslogPrior));
}

void sortGroups(const std::string& grouping, std::vector<Group>& groups) {
    const auto order = [&](const Group& a, const Group& b) {
        if (grouping == "level") {
            return std::pair(severity(a.name), a.name) < std::pair(severity(b.name), b.name);
        }
        const bool byTime = grouping == "hour" || grouping == "day";
        return byTime || a.rows == b.rows ? a.name < b.name : a.rows > b.rows;
    };
    std::sort(groups.begin(), groups.end(), order);
}

}  // namespace

std::vector<Group> CountBy(const Source& source, const Selection& selection, const std::string& grouping) {
    const Grouping& how = groupingNamed(grouping, selection.table);
    std::unordered_map<std::string, uint64_t> counts;
    const auto add = [&](std::string_view name, uint64_t rows) { counts[shownAs(how, name)] += rows; };
    if (selection.filter.literal.empty()) {
        source.groups(selection.table, selection.filter.conditions, how.expression, add);
    } else {
        Selection all = selection;
        all.limit = all.offset = 0;
        Select(source, all, [&](const Record& record) { add(how.of(record), 1); });
    }
    std::vector<Group> groups;
    groups.reserve(counts.size());
    for (const auto& [name, rows] : counts) {
        groups.push_back({name, rows});
        std::replace(groups.back().name.begin(), groups.back().name.end(), kNumberMark, '#');
    }
    sortGroups(grouping, groups);
    return groups;
}

}  // namespace quor::store
