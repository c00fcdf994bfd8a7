#include "store/filter.h"

#include <algorithm>

#include "base/numbers.h"
#include "base/utf8.h"
#include "store/columns.h"
#include "store/dates.h"
#include "store/failure.h"
#include "store/regex.h"

namespace quor::store {
namespace {

constexpr const char kUnknownLevel[] = "debug";  // as the library reads whatever is none of the levels
constexpr size_t kMaxPattern = 15000;            // the database refuses longer ones, brackets tripled

// A filter of the command line: the option, its value, the column that answers it.
template <typename Value>
struct Given {
    const char* option;
    Value FilterOptions::*value;
    const char* column;
    bool negated = false;
};

constexpr Given<Names> kLists[] = {
    {"--host", &FilterOptions::host, "host"},
    {"--level", &FilterOptions::level, "llevel"},
    {"--facility", &FilterOptions::facility, "fac"},
    {"--program", &FilterOptions::program, "prog"},
    {"--pid", &FilterOptions::pid, "pid"},
    {"--msgid", &FilterOptions::msgid, "msgid"},
    {"--ip", &FilterOptions::ip, "ip"},
    {"--not-host", &FilterOptions::notHost, "host", true},
    {"--not-level", &FilterOptions::notLevel, "llevel", true},
    {"--not-facility", &FilterOptions::notFacility, "fac", true},
    {"--not-program", &FilterOptions::notProgram, "prog", true},
};

constexpr Given<std::string> kTexts[] = {
    {"--sdata", &FilterOptions::sdata, "sdata"},
    {"--keyword", &FilterOptions::keyword, "msg"},
    {"--glob", &FilterOptions::glob, "msg"},
    {"--regex", &FilterOptions::regex, "msg"},
    {"--from", &FilterOptions::from, "ldate"},
    {"--to", &FilterOptions::to, "ldate"},
    {"--last", &FilterOptions::last, "ldate"},
    {"--not-keyword", &FilterOptions::notKeyword, "msg", true},
    {"--not-regex", &FilterOptions::notRegex, "msg", true},
};

// Hands over the option, the column and the value as one text of every filter that was given.
template <typename Visit>
void eachGiven(const FilterOptions& options, Visit visit) {
    for (const auto& given : kLists) {
        if (!(options.*given.value).empty()) {
            visit(given.option, given.column, InWords(options.*given.value));
        }
    }
    for (const auto& given : kTexts) {
        if (!(options.*given.value).empty()) {
            visit(given.option, given.column, options.*given.value);
        }
    }
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
    eachGiven(options, [&](const std::string& option, const char* column, const std::string& value) {
        if (!HasColumn(table, column)) {
            throw Failure(option + ": table " + table + " has no column for it; leave it out");
        }
        if (value.size() > kMaxPattern) {
            throw Failure(option + ": too long; give at most " + std::to_string(kMaxPattern) + " bytes");
        }
    });
    if (!comparesExactly(options.glob)) {
        throw Failure("--glob: the pattern is not UTF-8; give --keyword, which takes any bytes");
    }
    for (const auto& [option, pattern] : {std::pair("--regex", &options.regex), {"--not-regex", &options.notRegex}}) {
        if (!pattern->empty()) {
            CheckRegex(*pattern, options.ignoreCase, option);
        }
    }
}

// A row without a time of day meets any time of its day.
void addTimes(const Span& span, bool lenient, std::list<ColumnCondition>& conditions) {
    if (!span.from.time.empty()) {
        const char* columns = lenient ? "(ldate, ifnull(nullif(ltime, ''), '24'))" : "(ldate, ltime)";
        conditions.push_back({columns, {span.from.date, span.from.time}, Match::AtLeast});
    }
    if (!span.to.time.empty()) {
        const char* columns = lenient ? "(ldate, ifnull(ltime, ''))" : "(ldate, ltime)";
        conditions.push_back({columns, {span.to.date, span.to.time}, Match::AtMost});
    }
}

// Whatever is none of the levels is shown as debug, so it is found as that: by not being one of the other levels.
void addLevels(const Given<Names>& given, const FilterOptions& options, std::list<ColumnCondition>& conditions) {
    const std::list<std::string> levels = LevelsOf(options.*given.value, given.option);
    const bool debug = std::find(levels.begin(), levels.end(), kUnknownLevel) != levels.end();
    if (debug && (options.lenient || given.negated)) {
        conditions.push_back({given.column, OtherLevels(levels), Match::Any, !given.negated});
    } else if (!levels.empty()) {
        conditions.push_back({given.column, levels, Match::Any, given.negated});
    }
}

void refuseNegatedAny(const Given<Names>& given, const FilterOptions& options) {
    if (given.negated && !(options.*given.value).empty() &&
        NamesOf(options.*given.value, given.option, false).empty()) {
        throw Failure(std::string(given.option) + ": 'any' would leave nothing; name what is to be left out");
    }
}

void addLists(const FilterOptions& options, std::list<ColumnCondition>& conditions) {
    for (const auto& given : kLists) {
        refuseNegatedAny(given, options);
        if (std::string_view(given.column) == "llevel") {
            addLevels(given, options, conditions);
            continue;
        }
        std::list<std::string> names = NamesOf(options.*given.value, given.option, options.lenient);
        if (!names.empty()) {
            const Match match = options.lenient ? Match::Like : Match::Any;
            conditions.push_back({given.column, std::move(names), match, given.negated});
        }
    }
}

// What the library has no form for.
void addTexts(const FilterOptions& options, std::list<ColumnCondition>& conditions) {
    const auto add = [&](const std::string& text, const char* column, Match match, bool negated) {
        if (!text.empty()) {
            conditions.push_back({column, {text}, match, negated});
        }
    };
    const auto regex = [&](const std::string& pattern) {
        return pattern.empty() ? "" : RegexOf(pattern, options.ignoreCase);
    };
    const Match part = options.ignoreCase ? Match::PartNoCase : Match::Part;
    add(options.sdata, "sdata", Match::Part, false);
    add(options.ignoreCase ? options.keyword : "", "msg", part, false);
    add(options.notKeyword, "msg", part, true);
    add(regex(options.regex), "msg", Match::Regex, false);
    add(regex(options.notRegex), "msg", Match::Regex, true);
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
    Span span = spanOf(options, now);
    addLists(options, filter.conditions.columns);
    addTimes(span, options.lenient, filter.conditions.columns);
    addTexts(options, filter.conditions.columns);
    std::string pattern = patternOf(options);
    std::string none;  // names may hold what separates them for the library
    LogSearchCondListGen(none, none, none, none, pattern, span.from.date, span.to.date, filter.conditions.attributes);
    const bool inexact = holdsWildcard(options.keyword) || !comparesExactly(options.keyword);
    filter.literal = inexact && !options.ignoreCase ? options.keyword : "";
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
    FilterOptions none;
    none.lenient = options.lenient;
    for (const auto& given : kLists) {
        FilterOptions alone = none;
        if (!given.negated) {
            alone.*given.value = options.*given.value;
            add("has " + std::string(given.option) + " " + InWords(options.*given.value), alone);
        }
    }
    FilterOptions sdata = none;
    sdata.sdata = options.sdata;
    add("has --sdata " + options.sdata, sdata);
    FilterOptions times = none;
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
