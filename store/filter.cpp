#include "store/filter.h"

#include <algorithm>
#include <iterator>

#include "base/numbers.h"
#include "base/utf8.h"
#include "common.h"
#include "store/columns.h"
#include "store/dates.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr size_t kMaxPattern = 15000;  // the database refuses longer ones, brackets tripled

// A filter of the command line: the option, its value, the column that answers it.
struct Given {
    const char* option;
    std::string FilterOptions::*value;
    _SYSLOG_DB_ATTRI_tag attribute;
    bool isName;  // cheap to look for by itself
};

constexpr Given kFilters[] = {
    {"--host", &FilterOptions::host, SYSLOG_ATTRI_HOST, true},
    {"--level", &FilterOptions::level, SYSLOG_ATTRI_LLEVEL, true},
    {"--facility", &FilterOptions::facility, SYSLOG_ATTRI_FAC, true},
    {"--program", &FilterOptions::program, SYSLOG_ATTRI_PROG, true},
    {"--keyword", &FilterOptions::keyword, SYSLOG_ATTRI_MSG, false},
    {"--glob", &FilterOptions::glob, SYSLOG_ATTRI_MSG, false},
    {"--from", &FilterOptions::from, SYSLOG_ATTRI_LDATE, false},
    {"--to", &FilterOptions::to, SYSLOG_ATTRI_LDATE, false},
};

// Those on columns that the library does not know.
struct GivenColumn {
    const char* option;
    std::string FilterOptions::*value;
    const char* column;
    bool isPart;
};

constexpr GivenColumn kColumnFilters[] = {
    {"--pid", &FilterOptions::pid, "pid", false},
    {"--msgid", &FilterOptions::msgid, "msgid", false},
    {"--sdata", &FilterOptions::sdata, "sdata", true},
};

// Only table logs, to which the columns were added, has them.
bool hasColumn(const std::string& table, const Given& given) {
    return HasColumn(table, given.attribute);
}
bool hasColumn(const std::string& table, const GivenColumn& /*given*/) {
    return table == "logs";
}

template <typename Filters>
void checkColumns(const Filters& filters, const FilterOptions& options, const std::string& table) {
    for (const auto& given : filters) {
        if (!(options.*given.value).empty() && !hasColumn(table, given)) {
            throw Failure(std::string(given.option) + ": table " + table + " has no column for it; leave it out");
        }
    }
}

// The library would take the whole list "any" for no filter and an empty name for rows without one.
void checkNames(const char* option, const std::string& names) {
    const std::list<std::string> list = Tokenize(names, ",");
    if (list.size() > 1 && std::find(list.begin(), list.end(), "any") != list.end()) {
        throw Failure(std::string(option) + ": 'any' means every name; give it alone or leave it out");
    }
    if (std::find(list.begin(), list.end(), "") != list.end()) {
        throw Failure(std::string(option) + ": empty name in '" + names + "'; separate names with one comma");
    }
}

int levelIndex(const std::string& name) {
    const auto* found = std::find(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), name);
    return static_cast<int>(found - std::begin(g_MappingSyslogPrior));
}

[[noreturn]] void failLevel(const std::string& name) {
    std::string names;
    for (const char* known : g_MappingSyslogPrior) {
        names += names.empty() ? known : std::string(", ") + known;
    }
    throw Failure("--level: no such level '" + name + "'; give " + names + ", or err+ for err and worse");
}

// "err+" becomes "emerg,alert,crit,err".
std::string expandLevels(const std::string& levels) {
    if (levels.empty() || levels == "any") {
        return levels;
    }
    std::string expanded;
    for (const std::string& token : Tokenize(levels, ",")) {
        const bool orWorse = !token.empty() && token.back() == '+';
        const int last = levelIndex(token.substr(0, token.size() - (orWorse ? 1 : 0)));
        if (last == static_cast<int>(std::size(g_MappingSyslogPrior))) {
            failLevel(token);
        }
        for (int level = orWorse ? 0 : last; level <= last; ++level) {
            expanded += (expanded.empty() ? "" : ",") + std::string(g_MappingSyslogPrior[level]);
        }
    }
    return expanded;
}

bool holdsWildcard(const std::string& text) {
    return text.find_first_of("*?") != std::string::npos;
}

// The database compares a pattern by characters and takes every byte that belongs to none for U+FFFD, and so the two
// codes behind it.
bool comparesExactly(const std::string& text) {
    for (size_t at = 0; at < text.size();) {
        const Symbol symbol = NextSymbol(text, at);
        if (!symbol.valid || (symbol.code >= 0xFFFD && symbol.code <= 0xFFFF)) {
            return false;
        }
        at += symbol.length;
    }
    return true;
}

std::string patternOf(const FilterOptions& options) {
    if (options.keyword.empty()) {
        return options.glob == "**" ? "" : options.glob;  // matches everything, which the library takes for no filter
    }
    if (!comparesExactly(options.keyword)) {
        return "?*";  // the literal decides
    }
    std::string pattern = "*" + options.keyword + "*";
    std::replace(pattern.begin() + 1, pattern.end() - 1, '*', '?');
    return pattern;
}

void checkDates(const std::string& from, const std::string& to) {
    if (!from.empty() && !to.empty() && from > to) {
        throw Failure("--from " + from + " is after --to " + to + "; swap them");
    }
}

void check(const FilterOptions& options, const std::string& table) {
    checkColumns(kFilters, options, table);
    checkColumns(kColumnFilters, options, table);
    checkNames("--host", options.host);
    checkNames("--facility", options.facility);
    checkNames("--program", options.program);
    checkNames("--pid", options.pid);
    checkNames("--msgid", options.msgid);
    if (std::max(options.keyword.size(), options.glob.size()) > kMaxPattern) {
        throw Failure("the text to search for is too long; give at most " + std::to_string(kMaxPattern) + " bytes");
    }
    if (!comparesExactly(options.glob)) {
        throw Failure("--glob: the pattern is not UTF-8; give --keyword, which takes any bytes");
    }
}

std::list<ColumnCondition> columnConditions(const FilterOptions& options) {
    std::list<ColumnCondition> conditions;
    for (const GivenColumn& given : kColumnFilters) {
        const std::string& value = options.*given.value;
        if (!value.empty() && value != "any") {
            conditions.push_back(
                {given.column, given.isPart ? std::list<std::string>{value} : Tokenize(value, ","), given.isPart});
        }
    }
    return conditions;
}

std::string datesInWords(const std::string& from, const std::string& to) {
    if (from == to) {
        return "is dated " + from;
    }
    if (to.empty()) {
        return "is dated " + from + " or later";
    }
    return from.empty() ? "is dated " + to + " or earlier" : "is dated from " + from + " to " + to;
}

}  // namespace

bool Filter::accepts(const _SYSLOG_LOG_DATA_tag& record) const {
    return literal.empty() || record.msg.find(literal) != std::string::npos ||
           record.event.find(literal) != std::string::npos;
}

Filter BuildFilter(const FilterOptions& options, const std::string& table, time_t now) {
    check(options, table);
    FilterOptions checked = options;  // the library takes its arguments by reference
    checked.level = expandLevels(options.level);
    checked.from = ParseDate(options.from, "--from", now);
    checked.to = ParseDate(options.to, "--to", now);
    checkDates(checked.from, checked.to);
    std::string pattern = patternOf(options);
    Filter filter;
    LogSearchCondListGen(checked.host, checked.level, checked.facility, checked.program, pattern, checked.from,
                         checked.to, filter.conditions.attributes);
    filter.conditions.columns = columnConditions(options);
    const bool literal = holdsWildcard(options.keyword) || !comparesExactly(options.keyword);
    filter.literal = literal ? options.keyword : "";
    return filter;
}

std::vector<Probe> BuildProbes(const FilterOptions& options, const std::string& table, time_t now) {
    std::vector<Probe> probes;
    const auto add = [&](const std::string& words, const FilterOptions& alone) {
        Conditions conditions = BuildFilter(alone, table, now).conditions;
        if (!conditions.empty()) {
            probes.push_back({words, std::move(conditions)});
        }
    };
    const auto addNamed = [&](const auto& given) {
        FilterOptions alone;
        alone.*given.value = options.*given.value;
        add("has " + std::string(given.option) + " " + options.*given.value, alone);
    };
    for (const Given& given : kFilters) {
        if (given.isName) {
            addNamed(given);
        }
    }
    std::for_each(std::begin(kColumnFilters), std::end(kColumnFilters), addNamed);
    FilterOptions dates;
    dates.from = ParseDate(options.from, "--from", now);
    dates.to = ParseDate(options.to, "--to", now);
    add(datesInWords(dates.from, dates.to), dates);
    return probes;
}

_SYSLOG_SQL_COND_tag IdCondition(int op, uint64_t id) {
    _SYSLOG_SQL_COND_tag condition;
    condition.attr = SYSLOG_ATTRI_ID;
    condition.op = op;
    condition.value = Decimal(id);
    return condition;
}

}  // namespace quor::store
