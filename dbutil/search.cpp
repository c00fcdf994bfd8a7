#include "common.h"
#include "dbutil.h"

namespace {

constexpr int kEqual = 0;
constexpr int kAtMost = 3;
constexpr int kAtLeast = 5;
constexpr int kGlob = 8;

bool asksForNothing(const std::string& list) {
    return list.empty() || list == "any";
}

bool isUnsetDate(const std::string& date) {
    return date.empty() || date == "0";
}

void addList(_SYSLOG_DB_ATTRI_tag attr, const std::string& list, std::list<_SYSLOG_SQL_COND_tag>& conds) {
    if (!asksForNothing(list)) {
        OneCondListGen(attr, list, conds.emplace_back());
    }
}

void addDate(int op, const std::string& date, std::list<_SYSLOG_SQL_COND_tag>& conds) {
    if (!isUnsetDate(date)) {
        conds.push_back({SYSLOG_ATTRI_LDATE, op, date, {}});
    }
}

}  // namespace

int OneCondListGen(_SYSLOG_DB_ATTRI_tag attr, const std::string& text, _SYSLOG_SQL_COND_tag& cond) {
    if (asksForNothing(text)) {
        return 0;
    }
    std::list<std::string> values = Tokenize(text, ",");
    cond.attr = attr;
    cond.op = kEqual;
    cond.value = values.front();
    values.pop_front();
    for (const std::string& value : values) {
        cond.orList.push_back({attr, kEqual, value, {}});
    }
    return 0;
}

void LogSearchCondListGen(std::string& hosts, std::string& levels, std::string& facs, std::string& progs,
                          std::string& keyword, std::string& fromDate, std::string& toDate,
                          std::list<_SYSLOG_SQL_COND_tag>& conds) {
    addList(SYSLOG_ATTRI_HOST, hosts, conds);
    addList(SYSLOG_ATTRI_LLEVEL, levels, conds);
    addList(SYSLOG_ATTRI_FAC, facs, conds);
    addList(SYSLOG_ATTRI_PROG, progs, conds);
    if (!keyword.empty()) {
        conds.push_back({SYSLOG_ATTRI_MSG, kGlob, keyword, {}});
    }
    if (!isUnsetDate(fromDate) && fromDate == toDate) {
        addDate(kEqual, fromDate, conds);
        return;
    }
    addDate(kAtLeast, fromDate, conds);
    addDate(kAtMost, toDate, conds);
}
