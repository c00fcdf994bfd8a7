// Conditions on a real table: the rows that come back are those of a plain filter, and nothing is changed.
#include <sqlite3.h>

#include <cstdlib>
#include <cstring>
#include <set>

#include "dbutil.h"
#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

constexpr const char* kTexts[] = {"",
                                  "a",
                                  "A",
                                  "ab",
                                  "a*b",
                                  "a?b",
                                  "[a]",
                                  "]",
                                  "100%",
                                  "under_",
                                  "it's",
                                  "\"x\"",
                                  "--",
                                  ";",
                                  "\\",
                                  "b\\%_",
                                  "/*",
                                  "null",
                                  "O'Neil",
                                  "ab[cd]ef*",
                                  "' OR 1=1 --",
                                  "\xc3\xa9t\xc3\xa9",
                                  "\x01\x1b[2J",
                                  "ac"};
constexpr size_t kRows = sizeof kTexts / sizeof *kTexts;

// Row i: id i + 1, host and msg from the list.
const std::string& database() {
    static const std::string path = [] {
        const std::string file = quor::fuzz::ScratchPath("logs.db");
        sqlite3* db = nullptr;
        sqlite3_open(file.c_str(), &db);
        sqlite3_exec(db,
                     "CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, host TEXT, ip TEXT, fac TEXT, prio TEXT,"
                     " llevel TEXT GENERATED ALWAYS AS (prio) VIRTUAL, tag TEXT, utcsec INTEGER, tzoffset TEXT,"
                     " ldate TEXT, ltime TEXT, prog TEXT, msg TEXT)",
                     nullptr, nullptr, nullptr);
        sqlite3_stmt* insert = nullptr;
        sqlite3_prepare_v2(db, "INSERT INTO logs(utcsec, host, msg) VALUES(?1, ?2, ?3)", -1, &insert, nullptr);
        for (size_t i = 0; i < kRows; ++i) {
            sqlite3_bind_int64(insert, 1, static_cast<sqlite3_int64>(i * 7));
            sqlite3_bind_text(insert, 2, kTexts[i], -1, SQLITE_STATIC);
            sqlite3_bind_text(insert, 3, kTexts[(i + 5) % kRows], -1, SQLITE_STATIC);
            sqlite3_step(insert);
            sqlite3_reset(insert);
        }
        sqlite3_finalize(insert);
        sqlite3_close(db);
        return file;
    }();
    return path;
}

// One character of valid UTF-8 for the wildcards.
const char* next(const char* at) {
    for (++at; (*at & 0xc0) == 0x80; ++at) {
    }
    return at;
}

char folded(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
}

bool wild(const char* pattern, const char* text, bool fold) {
    if (*pattern == '*') {
        return wild(pattern + 1, text, fold) || (*text != '\0' && wild(pattern, next(text), fold));
    }
    if (*pattern == '?') {
        return *text != '\0' && wild(pattern + 1, next(text), fold);
    }
    const bool equal = fold ? folded(*pattern) == folded(*text) : *pattern == *text;
    return equal && (*pattern == '\0' || wild(pattern + 1, text + 1, fold));
}

bool compared(int order, int op) {
    const bool outcome[] = {order == 0, order != 0, order<0, order <= 0, order> 0, order >= 0};
    return outcome[op];
}

bool matchesText(const char* text, const _SYSLOG_SQL_COND_tag& condition) {
    const char* value = condition.value.c_str();
    switch (condition.op) {
    case 6:
        return wild(value, text, true);
    case 7:
        return !wild(value, text, true);
    case 8:
        return wild(value, text, false);
    case 9:
        return !wild(value, text, false);
    default:
        return compared(strcmp(text, value), condition.op);
    }
}

bool matches(size_t row, const _SYSLOG_SQL_COND_tag& condition) {
    if (condition.attr == SYSLOG_ATTRI_HOST || condition.attr == SYSLOG_ATTRI_MSG) {
        return matchesText(kTexts[(row + (condition.attr == SYSLOG_ATTRI_MSG ? 5 : 0)) % kRows], condition);
    }
    const long long number = static_cast<long long>(condition.attr == SYSLOG_ATTRI_ID ? row + 1 : row * 7);
    const long long value = strtoll(condition.value.c_str(), nullptr, 10);
    return compared(number < value ? -1 : number > value, condition.op);
}

bool matchesAny(size_t row, const _SYSLOG_SQL_COND_tag& condition) {
    bool found = matches(row, condition);
    for (const _SYSLOG_SQL_COND_tag& other : condition.orList) {
        found = found || matches(row, other);
    }
    return found;
}

// Few wildcards, so that the plain filter ends; invalid UTF-8 has no characters for it to count.
bool isPlain(const std::string& value) {
    int stars = 0;
    for (const char c : value) {
        stars += c == '*' ? 1 : 0;
        if (static_cast<signed char>(c) < 0) {
            return false;
        }
    }
    return stars < 6;
}

_SYSLOG_SQL_COND_tag consume(FuzzedDataProvider& data, bool& plain) {
    constexpr _SYSLOG_DB_ATTRI_tag kAttributes[] = {SYSLOG_ATTRI_HOST, SYSLOG_ATTRI_MSG, SYSLOG_ATTRI_ID,
                                                    SYSLOG_ATTRI_UTCSEC};
    _SYSLOG_SQL_COND_tag condition;
    condition.attr = data.PickValueInArray(kAttributes);
    if (condition.attr == SYSLOG_ATTRI_ID || condition.attr == SYSLOG_ATTRI_UTCSEC) {
        condition.op = data.ConsumeIntegralInRange(0, 5);
        condition.value = std::to_string(data.ConsumeIntegralInRange(-3, 200));
        return condition;
    }
    condition.op = data.ConsumeIntegralInRange(0, 9);
    condition.value =
        data.ConsumeBool() ? kTexts[data.ConsumeIntegralInRange<size_t>(0, kRows - 1)] : quor::fuzz::AnyText(data, 24);
    plain = plain && isPlain(condition.value);
    return condition;
}

int collect(_SYSLOG_LOG_DATA_tag& record, void* ids) {
    static_cast<std::set<unsigned long long>*>(ids)->insert(record.id);
    return 0;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    std::string path = database();
    static const std::string before = quor::fuzz::ReadFile(path);
    FuzzedDataProvider data(bytes, size);
    bool plain = true;
    std::list<_SYSLOG_SQL_COND_tag> conditions;
    while (conditions.size() < 3 && data.ConsumeBool()) {
        conditions.push_back(consume(data, plain));
        while (conditions.back().orList.size() < 3 && data.ConsumeBool()) {
            conditions.back().orList.push_back(consume(data, plain));
        }
    }
    std::set<unsigned long long> expected;
    for (size_t row = 0; row < kRows && plain; ++row) {
        bool all = true;
        for (const _SYSLOG_SQL_COND_tag& condition : conditions) {
            all = all && matchesAny(row, condition);
        }
        if (all) {
            expected.insert(row + 1);
        }
    }
    std::set<unsigned long long> found;
    const int status = SyslogDBSelect(path, conditions, nullptr, nullptr, collect, &found, false);
    Require(status == 0, "every text condition is good SQL");
    Require(!plain || found == expected, "the rows are those of the plain filter");
    const bool matchAll = conditions.size() == 1 && conditions.front().value == "**";
    Require(!plain || conditions.empty() || matchAll ||
                SyslogDBSelectCount(path, conditions, nullptr, nullptr) == static_cast<int>(expected.size()),
            "the count is that of the rows");
    Require(quor::fuzz::ReadFile(path) == before, "the database is unchanged");
    return 0;
}
