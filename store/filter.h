// The filters that every program shares, checked and turned into search conditions.
#ifndef STORE_FILTER_H
#define STORE_FILTER_H

#include <ctime>
#include <list>
#include <string>
#include <vector>

#include "dbutil.h"
#include "store/names.h"

namespace quor::store {

// How a column compares.
enum class Match {
    Any,         // it is one of the values
    Like,        // the same, and values with "*" or "?" are patterns
    Part,        // the one value is part of it
    PartNoCase,  // the same, whatever the case of ASCII letters
    Regex,       // it holds a match of the one value, made by RegexOf()
    AtLeast,     // two columns, written as such, compared with two values
    AtMost,
};

// A condition that the library has no form for.
struct ColumnCondition {
    const char* column;
    std::list<std::string> values;
    Match match = Match::Any;
    bool negated = false;  // also met by rows without a value
};

// All of them hold.
struct Conditions {
    std::list<_SYSLOG_SQL_COND_tag> attributes;
    std::list<ColumnCondition> columns;

    bool empty() const { return attributes.empty() && columns.empty(); }
};

// As a person gives them; an empty one is left out.
struct FilterOptions {
    Names host;
    Names level;
    Names facility;
    Names program;
    Names pid;
    Names msgid;
    Names ip;
    std::string sdata;  // a part of the structured data
    std::string keyword;
    std::string glob;
    std::string regex;
    std::string from;
    std::string to;
    std::string last;  // a time span, in place of from
    Names notHost;
    Names notLevel;
    Names notFacility;
    Names notProgram;
    std::string notKeyword;
    std::string notRegex;
    bool ignoreCase = false;  // of the keywords, for ASCII letters, and of the regular expressions
    // Finds whatever may be meant: names with "*" or "?" are patterns, a list is also one name, a row without a time of
    // day belongs to the whole day, one without a known level is shown as debug and so found. Else names are taken as
    // they stand, whatever a sender wrote, and only what is surely meant is found.
    bool lenient = false;
};

struct Filter {
    Conditions conditions;
    // What a message must contain besides meeting the conditions, or empty when those are exact. A pattern cannot quote
    // "*" and "?": the conditions take them for any one character.
    std::string literal;

    bool accepts(const _SYSLOG_LOG_DATA_tag& record) const;
};

// Failure for a filter that the table cannot answer, and for a value that would silently match nothing or everything.
// Failures name the filters as options of a command line.
Filter BuildFilter(const FilterOptions& options, const std::string& table, time_t now);

// One of several filters by itself, and what follows "no row" when nothing meets it.
struct Probe {
    std::string words;
    Conditions conditions;
};
// Of the filters that were given, those whose columns are cheap to look at: not the keyword and the pattern.
std::vector<Probe> BuildProbes(const FilterOptions& options, const std::string& table, time_t now);

// A condition on the id; `op` is one of SYSLOG_OP_....
_SYSLOG_SQL_COND_tag IdCondition(int op, uint64_t id);

}  // namespace quor::store

#endif
