// Search forms: the conditions are those that the texts name, and their SQL reads back as one statement.
#include <sqlite3.h>

#include "common.h"
#include "dbutil.h"
#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

// Every alternative of a list, in order; none for a list that asks for nothing.
void checkList(std::list<_SYSLOG_SQL_COND_tag>& conditions, const std::string& text, _SYSLOG_DB_ATTRI_tag attribute) {
    if (text.empty() || text == "any") {
        return;
    }
    Require(!conditions.empty(), "a list gives a condition");
    const _SYSLOG_SQL_COND_tag condition = conditions.front();
    conditions.pop_front();
    std::string joined = condition.value;
    for (const _SYSLOG_SQL_COND_tag& other : condition.orList) {
        Require(other.attr == attribute && other.op == 0 && other.orList.empty(), "an alternative is an equality");
        joined += "," + other.value;
    }
    Require(condition.attr == attribute && condition.op == 0 && joined == text, "the values are those of the list");
}

void checkOne(std::list<_SYSLOG_SQL_COND_tag>& conditions, _SYSLOG_DB_ATTRI_tag attribute, int op,
              const std::string& value) {
    Require(!conditions.empty() && conditions.front().attr == attribute && conditions.front().op == op &&
                conditions.front().value == value,
            "a single criterion gives its condition");
    conditions.pop_front();
}

// SQLite takes the rendering as one whole expression over the table.
void checkSql(std::list<_SYSLOG_SQL_COND_tag>& conditions) {
    static sqlite3* const db = [] {
        sqlite3* memory = nullptr;
        sqlite3_open(":memory:", &memory);
        sqlite3_exec(memory, "CREATE TABLE logs(host, llevel, fac, prog, msg, ldate)", nullptr, nullptr, nullptr);
        return memory;
    }();
    std::string sql;
    Require(SqlCondListToStr(conditions, sql) == 0, "conditions render");
    sql = "SELECT 1 FROM logs" + (sql.empty() ? "" : " WHERE " + sql);
    sqlite3_stmt* statement = nullptr;
    const char* tail = nullptr;
    const int status = sqlite3_prepare_v2(db, sql.c_str(), -1, &statement, &tail);
    Require(status == SQLITE_OK && *tail == '\0' && sqlite3_stmt_readonly(statement) != 0, "one statement, reading");
    sqlite3_finalize(statement);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    FuzzedDataProvider data(bytes, size);
    std::string texts[7];
    for (std::string& text : texts) {
        text = data.ConsumeBool() ? data.PickValueInArray({"", "any", "0", "a,b", ",", "2014/01/02", "**"})
                                  : quor::fuzz::AnyText(data, 40);
    }
    auto& [hosts, levels, facs, progs, keyword, from, to] = texts;
    std::list<_SYSLOG_SQL_COND_tag> conditions;
    LogSearchCondListGen(hosts, levels, facs, progs, keyword, from, to, conditions);
    checkSql(conditions);
    checkList(conditions, hosts, SYSLOG_ATTRI_HOST);
    checkList(conditions, levels, SYSLOG_ATTRI_LLEVEL);
    checkList(conditions, facs, SYSLOG_ATTRI_FAC);
    checkList(conditions, progs, SYSLOG_ATTRI_PROG);
    if (!keyword.empty()) {
        checkOne(conditions, SYSLOG_ATTRI_MSG, 8, keyword);
    }
    const bool begins = !from.empty() && from != "0";
    const bool ends = !to.empty() && to != "0";
    if (begins) {
        checkOne(conditions, SYSLOG_ATTRI_LDATE, from == to ? 0 : 5, from);
    }
    if (ends && from != to) {
        checkOne(conditions, SYSLOG_ATTRI_LDATE, 3, to);
    }
    Require(conditions.empty(), "no other condition");
    return 0;
}
