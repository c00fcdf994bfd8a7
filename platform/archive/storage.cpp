#include "platform/archive/storage.h"

#include <new>

namespace quor::archive {

void Require(sqlite3* db, int status) {
    if ((status & 0xff) == SQLITE_NOMEM) {
        throw std::bad_alloc();
    }
    if (status != SQLITE_OK && status != SQLITE_ROW && status != SQLITE_DONE) {
        throw Refused(db, status);
    }
}

Statement Prepared(sqlite3* db, const std::string& sql) {
    Statement statement;
    Require(db, sqlite3_prepare_v2(db, sql.c_str(), -1, Adopt(statement), nullptr));
    return statement;
}

bool NextRow(sqlite3* db, const Statement& statement) {
    const int status = sqlite3_step(statement.get());
    Require(db, status);
    return status == SQLITE_ROW;
}

void Run(sqlite3* db, const std::string& sql) {
    Require(db, sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr));
}

std::string QuotedName(const std::string& name) {
    std::string quoted = "\"";
    for (const char c : name) {
        quoted.append(c == '"' ? 2 : 1, c);
    }
    return quoted + '"';
}

std::string_view BlobOf(const Statement& statement, int column) {
    const void* bytes = sqlite3_column_blob(statement.get(), column);
    return {bytes != nullptr ? static_cast<const char*>(bytes) : "",
            static_cast<size_t>(sqlite3_column_bytes(statement.get(), column))};
}

std::string TextOf(const Statement& statement, int column) {
    return std::string(BlobOf(statement, column));
}

void Storage::create() const {
    Run(db_, "CREATE TABLE " + table("logs_blocks (id INTEGER PRIMARY KEY, head BLOB NOT NULL)"));
    Run(db_, "CREATE TABLE " + table("logs_data (id INTEGER PRIMARY KEY, data BLOB NOT NULL)"));
    Run(db_, "CREATE TABLE " + table("logs_blooms (id INTEGER PRIMARY KEY, bloom BLOB NOT NULL)"));
}

void Storage::put(Statement& statement, const std::string& sql, int64_t key, const std::string& bytes) {
    if (statement == nullptr) {
        statement = Prepared(db_, sql);
    }
    sqlite3_bind_int64(statement.get(), 1, key);
    sqlite3_bind_blob64(statement.get(), 2, bytes.data(), bytes.size(), SQLITE_STATIC);
    const int status = sqlite3_step(statement.get());
    sqlite3_reset(statement.get());
    sqlite3_clear_bindings(statement.get());
    Require(db_, status);
}

void Storage::write(const char* how, const BlockBytes& block, int64_t key) {
    put(addHead_, how + table("logs_blocks VALUES (?1, ?2)"), key, block.head);
    put(addData_, how + table("logs_data VALUES (?1, ?2)"), key, block.data);
    if (!block.bloom.empty()) {
        put(addBloom_, how + table("logs_blooms VALUES (?1, ?2)"), key, block.bloom);
    }
}

void Storage::add(const BlockBytes& block, int64_t key) {
    write("INSERT INTO ", block, key);
}

void Storage::replace(const BlockBytes& block, int64_t key) {
    remove(key);
    write("INSERT INTO ", block, key);
}

void Storage::remove(int64_t key) {
    for (const char* name : {"logs_blocks", "logs_data", "logs_blooms"}) {
        Run(db_, "DELETE FROM " + table(name) + " WHERE id = " + std::to_string(key));
    }
}

std::optional<int64_t> Storage::keyFor(int64_t id) const {
    const Statement query = Prepared(db_, "SELECT max(id) FROM " + table("logs_blocks WHERE id <= ?1"));
    sqlite3_bind_int64(query.get(), 1, id);
    const bool found = NextRow(db_, query) && sqlite3_column_type(query.get(), 0) != SQLITE_NULL;
    return found ? std::optional<int64_t>(sqlite3_column_int64(query.get(), 0)) : std::nullopt;
}

std::string Storage::head(int64_t key) const {
    const Statement query = Prepared(db_, "SELECT head FROM " + table("logs_blocks WHERE id = ?1"));
    sqlite3_bind_int64(query.get(), 1, key);
    return NextRow(db_, query) ? TextOf(query, 0) : std::string();
}

}  // namespace quor::archive
