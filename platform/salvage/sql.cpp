#include "platform/salvage/sql.h"

#include <new>

namespace quor::salvage {

Database OpenScratch() {
    Database db;
    WithMemory(sqlite3_open(":memory:", Adopt(db)));
    return db;
}

int WithMemory(int status) {
    if ((status & 0xff) == SQLITE_NOMEM) {
        throw std::bad_alloc();
    }
    return status;
}

std::string TextOf(const Statement& query, int column) {
    const unsigned char* text = sqlite3_column_text(query.get(), column);
    if (text == nullptr) {
        WithMemory(sqlite3_errcode(sqlite3_db_handle(query.get())));
    }
    return text != nullptr ? reinterpret_cast<const char*>(text) : "";
}

std::string Quoted(const std::string& name) {
    std::string text = "\"";
    for (const char c : name) {
        text.append(c == '"' ? 2 : 1, c);
    }
    return text + '"';
}

Statement Prepare(sqlite3* db, const std::string& sql) {
    Statement statement = PrepareOnly(db, sql.c_str());
    if (statement == nullptr) {
        WithMemory(sqlite3_errcode(db));
    }
    return statement;
}

bool NextRow(const Statement& query) {
    return query != nullptr && WithMemory(sqlite3_step(query.get())) == SQLITE_ROW;
}

}  // namespace quor::salvage
