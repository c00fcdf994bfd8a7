#include "platform/db/statement.h"

#include <cstring>

namespace quor {
namespace {

const char* skipBlockComment(const char* sql) {
    const char* end = strstr(sql + 2, "*/");
    return end != nullptr ? end + 2 : sql + strlen(sql);  // SQLite lets the end of the text close it
}

// Past the blank or comment at `sql`, as SQLite's tokenizer sees them; `sql` itself when there is none.
const char* skipBlank(const char* sql) {
    if (strncmp(sql, "--", 2) == 0) {
        return sql + strcspn(sql, "\n");
    }
    if (strncmp(sql, "/*", 2) == 0) {
        return skipBlockComment(sql);
    }
    return sql + strspn(sql, " \t\n\f\r");
}

// Past one token: a quoted text whole, anything else byte by byte.
const char* skipToken(const char* sql) {
    const char close = *sql == '[' ? ']' : *sql;
    if (strchr("'\"`[", *sql) == nullptr) {
        return sql + 1;
    }
    const char* end = strchr(sql + 1, close);  // a doubled quote is two texts side by side
    return end != nullptr ? end + 1 : sql + strlen(sql);
}

// True when nothing that runs is left.
bool nothingFollows(const char* sql) {
    while (*sql != '\0') {
        const char* next = *sql == ';' ? sql + 1 : skipBlank(sql);
        if (next == sql) {
            return false;
        }
        sql = next;
    }
    return true;
}

// Behind the last token of the first statement.
const char* endOfStatement(const char* sql) {
    const char* end = sql + strspn(sql, "; \t\n\f\r");
    for (sql = end; *sql != '\0' && *sql != ';';) {
        const char* next = skipBlank(sql);
        if (next == sql) {
            next = end = skipToken(sql);
        }
        sql = next;
    }
    return end;
}

void fail(sqlite3_context* context, int /*count*/, sqlite3_value** values) {
    sqlite3_result_error(context, reinterpret_cast<const char*>(sqlite3_value_text(values[1])), -1);
    sqlite3_result_error_code(context, sqlite3_value_int(values[0]));
}

}  // namespace

// SQLite sets the error of a handle only by failing, so a function of our own fails with it.
void SetError(sqlite3* db, int code, const char* text) {
    sqlite3_create_function_v2(db, "quordb_fail", 2, SQLITE_UTF8, nullptr, fail, nullptr, nullptr, nullptr);
    Statement statement;
    sqlite3_prepare_v2(db, "SELECT quordb_fail(?1, ?2)", -1, Adopt(statement), nullptr);
    sqlite3_bind_int(statement.get(), 1, code);
    sqlite3_bind_text(statement.get(), 2, text, -1, SQLITE_STATIC);
    sqlite3_step(statement.get());
}

Statement PrepareOnly(sqlite3* db, const char* sql) {
    Statement statement;
    const char* tail = sql;
    if (sqlite3_prepare_v2(db, sql, -1, Adopt(statement), &tail) != SQLITE_OK) {
        return nullptr;
    }
    if (statement == nullptr) {
        SetError(db, SQLITE_EMPTY, "empty statement");
    } else if (!nothingFollows(tail)) {
        statement.reset();
        SetError(db, SQLITE_ERROR, "only one statement can be run at a time");
    }
    return statement;
}

std::string WithWindow(const char* sql, uint32_t count, uint32_t skip) {
    const char* end = endOfStatement(sql);
    const std::string limit = count != 0 ? std::to_string(count) : "-1";
    return std::string(sql, end) + " LIMIT " + limit + " OFFSET " + std::to_string(skip) + end;
}

}  // namespace quor
