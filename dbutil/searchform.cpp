#include "common.h"
#include "dbutil.h"

namespace {

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
    cond.op = SYSLOG_OP_EQUAL;
    cond.value = values.front();
    values.pop_front();
    for (const std::string& value : values) {
        cond.orList.push_back({attr, SYSLOG_OP_EQUAL, value, {}});
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
        conds.push_back({SYSLOG_ATTRI_MSG, SYSLOG_OP_GLOB, keyword, {}});
    }
    if (!isUnsetDate(fromDate) && fromDate == toDate) {
        addDate(SYSLOG_OP_EQUAL, fromDate, conds);
        return;
    }
    addDate(SYSLOG_OP_AT_LEAST, fromDate, conds);
    addDate(SYSLOG_OP_AT_MOST, toDate, conds);
}
