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
    const char* column;
    bool isName = false;  // cheap to look for by itself
};

constexpr Given kFilters[] = {
    {"--host", &FilterOptions::host, "host", true},
    {"--level", &FilterOptions::level, "llevel", true},
    {"--facility", &FilterOptions::facility, "fac", true},
    {"--program", &FilterOptions::program, "prog", true},
    {"--pid", &FilterOptions::pid, "pid", true},
    {"--msgid", &FilterOptions::msgid, "msgid", true},
    {"--sdata", &FilterOptions::sdata, "sdata", true},
    {"--ip", &FilterOptions::ip, "ip", true},
    {"--keyword", &FilterOptions::keyword, "msg"},
    {"--glob", &FilterOptions::glob, "msg"},
    {"--from", &FilterOptions::from, "ldate"},
    {"--to", &FilterOptions::to, "ldate"},
    {"--last", &FilterOptions::last, "ldate"},
    {"--not-host", &FilterOptions::notHost, "host"},
    {"--not-level", &FilterOptions::notLevel, "llevel"},
    {"--not-facility", &FilterOptions::notFacility, "fac"},
    {"--not-program", &FilterOptions::notProgram, "prog"},
    {"--not-keyword", &FilterOptions::notKeyword, "msg"},
};

void checkColumns(const FilterOptions& options, const std::string& table) {
    for (const Given& given : kFilters) {
        if (!(options.*given.value).empty() && !HasColumn(table, given.column)) {
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

// The names that other programs and people use, and the numbers.
int levelIndex(const std::string& text) {
    constexpr std::pair<const char*, int> kOthers[] = {{"emergency", 0},    {"panic", 0}, {"critical", 2},
                                                       {"error", 3},        {"warn", 4},  {"information", 6},
                                                       {"informational", 6}};
    std::string name = text;
    std::transform(name.begin(), name.end(), name.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
    if (name.size() == 1 && name[0] >= '0' && name[0] <= '7') {
        return name[0] - '0';
    }
    for (const auto& [other, level] : kOthers) {
        if (name == other) {
            return level;
        }
    }
    const auto* found = std::find(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), name);
    return static_cast<int>(found - std::begin(g_MappingSyslogPrior));
}

[[noreturn]] void failLevel(const std::string& option, const std::string& name) {
    std::string names;
    for (const char* known : g_MappingSyslogPrior) {
        names += names.empty() ? known : std::string(", ") + known;
    }
    throw Failure(option + ": no such level '" + name + "'; give " + names +
                  ", a number from 0 to 7, or err+ for err and worse");
}

// "err+" becomes "emerg,alert,crit,err".
std::string expandLevels(const std::string& levels, const std::string& option) {
    if (levels.empty() || levels == "any") {
        return levels;
    }
    std::string expanded;
    for (const std::string& token : Tokenize(levels, ",")) {
        const bool orWorse = !token.empty() && token.back() == '+';
        const int last = levelIndex(token.substr(0, token.size() - (orWorse ? 1 : 0)));
        if (last == static_cast<int>(std::size(g_MappingSyslogPrior))) {
            failLevel(option, token);
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
    if (options.ignoreCase) {
        return "";
    }
    if (!comparesExactly(options.keyword)) {
        return "?*";  // the literal decides
    }
    std::string pattern = "*" + options.keyword + "*";
    std::replace(pattern.begin() + 1, pattern.end() - 1, '*', '?');
    return pattern;
}

// The span that dates and times leave.
struct Span {
    Moment from;
    Moment to;
};

Span spanOf(const FilterOptions& options, time_t now) {
    if (!options.from.empty() && !options.last.empty()) {
        throw Failure("--from and --last both say where to begin; give one of them");
    }
    Span span{ParseMoment(options.from, "--from", now), ParseMoment(options.to, "--to", now)};
    if (!options.last.empty()) {
        span.from = MomentOf(int64_t{now} - static_cast<int64_t>(ParseSpan(options.last, "--last")));
        if (span.from.empty()) {
            throw Failure("--last: '" + options.last + "' is too long ago; give less");
        }
    }
    if (!span.from.empty() && !span.to.empty() && span.from.text("00:00:00") > span.to.text("23:59:59")) {
        throw Failure("--from " + options.from + options.last + " is after --to " + options.to + "; swap them");
    }
    return span;
}

void check(const FilterOptions& options, const std::string& table) {
    checkColumns(options, table);
    for (const Given& given : kFilters) {
        const bool text = given.value == &FilterOptions::sdata || std::string_view(given.column) == "msg" ||
                          std::string_view(given.column) == "ldate" || std::string_view(given.column) == "llevel";
        if (!text) {
            checkNames(given.option, options.*given.value);
        }
    }
    for (const Given& given : kFilters) {
        if ((options.*given.value).size() > kMaxPattern) {
            throw Failure(std::string(given.option) + ": too long; give at most " + std::to_string(kMaxPattern) +
                          " bytes");
        }
    }
    if (!comparesExactly(options.glob)) {
        throw Failure("--glob: the pattern is not UTF-8; give --keyword, which takes any bytes");
    }
}

bool isList(const std::string& names) {
    return !names.empty() && names != "any";
}

void addTimes(const Span& span, std::list<ColumnCondition>& conditions) {
    if (!span.from.time.empty()) {
        conditions.push_back({"(ldate, ltime)", {span.from.date, span.from.time}, Match::AtLeast});
    }
    if (!span.to.time.empty()) {
        conditions.push_back({"(ldate, ltime)", {span.to.date, span.to.time}, Match::AtMost});
    }
}

// What the library has no form for; it leaves it out of `options`.
std::list<ColumnCondition> takeColumns(FilterOptions& options) {
    std::list<ColumnCondition> conditions;
    const Match any = options.patterns ? Match::Like : Match::Any;
    const auto addList = [&](std::string& names, const char* column, bool negated) {
        if (isList(names)) {
            conditions.push_back({column, Tokenize(names, ","), any, negated});
        }
        names.clear();
    };
    const auto addPart = [&](std::string& text, const char* column, Match match, bool negated) {
        if (!text.empty()) {
            conditions.push_back({column, {text}, match, negated});
        }
        text.clear();
    };
    const Match part = options.ignoreCase ? Match::PartNoCase : Match::Part;
    addList(options.pid, "pid", false);
    addList(options.msgid, "msgid", false);
    addList(options.ip, "ip", false);
    addPart(options.sdata, "sdata", Match::Part, false);
    addList(options.notHost, "host", true);
    addList(options.notLevel, "llevel", true);
    addList(options.notFacility, "fac", true);
    addList(options.notProgram, "prog", true);
    addPart(options.notKeyword, "msg", part, true);
    if (options.patterns && holdsWildcard(options.host)) {
        addList(options.host, "host", false);
    }
    if (options.patterns && holdsWildcard(options.program)) {
        addList(options.program, "prog", false);
    }
    if (options.ignoreCase) {
        addPart(options.keyword, "msg", part, false);
    }
    return conditions;
}

std::string spanInWords(const Span& span) {
    const auto words = [](const Moment& moment) {
        return moment.date + (moment.time.empty() ? "" : " " + moment.time);
    };
    const std::string from = words(span.from);
    const std::string to = words(span.to);
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
    Filter filter;
    FilterOptions rest = options;  // the library takes its arguments by reference
    rest.level = expandLevels(options.level, "--level");
    rest.notLevel = expandLevels(options.notLevel, "--not-level");
    const Span span = spanOf(options, now);
    std::string pattern = patternOf(options);
    filter.conditions.columns = takeColumns(rest);
    addTimes(span, filter.conditions.columns);
    rest.from = span.from.date;
    rest.to = span.to.date;
    LogSearchCondListGen(rest.host, rest.level, rest.facility, rest.program, pattern, rest.from, rest.to,
                         filter.conditions.attributes);
    filter.literal = holdsWildcard(rest.keyword) || !comparesExactly(rest.keyword) ? rest.keyword : "";
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
    for (const Given& given : kFilters) {
        if (given.isName) {
            FilterOptions alone;
            alone.patterns = options.patterns;
            alone.*given.value = options.*given.value;
            add("has " + std::string(given.option) + " " + options.*given.value, alone);
        }
    }
    FilterOptions times;
    times.from = options.from;
    times.to = options.to;
    times.last = options.last;
    add(spanInWords(spanOf(options, now)), times);
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
