// The filters that every command shares, checked and turned into search conditions.
#ifndef QUORLOG_FILTERS_H
#define QUORLOG_FILTERS_H

#include <ctime>
#include <list>
#include <string>
#include <vector>

#include "dbutil.h"

namespace quor::cli {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

// As given on the command line; empty asks for nothing. Lists are separated by commas.
struct FilterOptions {
    std::string host;
    std::string level;
    std::string facility;
    std::string program;
    std::string keyword;
    std::string glob;
    std::string from;
    std::string to;
};

struct Filter {
    Conditions conditions;
    // The conditions take "*" and "?" of a keyword for any one character, because a pattern cannot quote them. A
    // message counts only when it contains this text; empty when the conditions are exact.
    std::string literal;

    bool accepts(const _SYSLOG_LOG_DATA_tag& record) const;
};

// Failure for a filter that the table cannot answer, and for a value that would silently match nothing or everything.
Filter BuildFilter(const FilterOptions& options, const std::string& table, time_t now);

// Each filter that can be told apart cheaply, alone, with the words for "no row ...".
struct Probe {
    std::string words;
    Conditions conditions;
};
std::vector<Probe> BuildProbes(const FilterOptions& options, const std::string& table, time_t now);

_SYSLOG_SQL_COND_tag IdCondition(int op, unsigned long long id);

// Operators of conditions, as g_MappingSyslogOP numbers them.
enum Operator : int { kBelow = 2, kAtMost = 3, kAbove = 4, kAtLeast = 5 };

}  // namespace quor::cli

#endif
