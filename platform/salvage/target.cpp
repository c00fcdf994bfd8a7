#include "platform/salvage/target.h"

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <new>

namespace quor::salvage {
namespace {

// Memory that runs out is no fault of a definition or of a row, which could be left out: everything fails.
int withMemory(int status) {
    if ((status & 0xff) == SQLITE_NOMEM) {
        throw std::bad_alloc();
    }
    return status;
}

std::string textOf(sqlite3_stmt* statement, int column) {
    const unsigned char* text = sqlite3_column_text(statement, column);
    if (text == nullptr) {
        withMemory(sqlite3_errcode(sqlite3_db_handle(statement)));
    }
    return text != nullptr ? reinterpret_cast<const char*>(text) : "";
}

std::string quoted(const std::string& name) {
    std::string text = "\"";
    for (const char c : name) {
        text.append(c == '"' ? 2 : 1, c);
    }
    return text + '"';
}

// Definitions come from a file that may be hostile: they may define, and nothing else.
int allowDefinitions(void* /*context*/, int action, const char*, const char*, const char*, const char*) {
    return action == SQLITE_SELECT || action == SQLITE_ATTACH || action == SQLITE_CREATE_VTABLE ? SQLITE_DENY
                                                                                                : SQLITE_OK;
}

Statement prepare(sqlite3* db, const std::string& sql) {
    Statement statement = PrepareOnly(db, sql.c_str());
    if (statement == nullptr) {
        withMemory(sqlite3_errcode(db));
    }
    return statement;
}

bool nextRow(const Statement& query) {
    return query != nullptr && withMemory(sqlite3_step(query.get())) == SQLITE_ROW;
}

int define(sqlite3* db, const std::string& sql, const char* kind) {
    if (sqlite3_strnicmp(sql.c_str(), kind, static_cast<int>(strlen(kind))) != 0) {
        return SQLITE_ERROR;
    }
    sqlite3_set_authorizer(db, allowDefinitions, nullptr);
    const Statement statement = prepare(db, sql);
    const int status = statement != nullptr ? sqlite3_step(statement.get()) : sqlite3_errcode(db);
    sqlite3_set_authorizer(db, nullptr, nullptr);
    return withMemory(status);
}

// The fault lies with the definition, or with rows that are not unique.
bool isRefusal(int status) {
    constexpr int kRefusals[] = {SQLITE_ERROR, SQLITE_AUTH, SQLITE_CONSTRAINT, SQLITE_TOOBIG};
    return std::find(std::begin(kRefusals), std::end(kRefusals), status & 0xff) != std::end(kRefusals);
}

Schema readSchema(sqlite3* db) {
    Schema schema;
    const Statement query = prepare(db, "SELECT type, name, sql FROM sqlite_master WHERE sql IS NOT NULL");
    while (nextRow(query)) {
        schema.push_back({textOf(query.get(), 0), textOf(query.get(), 1), 0, textOf(query.get(), 2)});
    }
    return schema;
}

int bindText(sqlite3_stmt* statement, int index, const Value& value, uint32_t encoding) {
    constexpr unsigned char kEncodings[] = {SQLITE_UTF8, SQLITE_UTF8, SQLITE_UTF16LE, SQLITE_UTF16BE};
    return sqlite3_bind_text64(statement, index, reinterpret_cast<const char*>(value.bytes), value.size, SQLITE_STATIC,
                               kEncodings[encoding]);
}

int bind(sqlite3_stmt* statement, int index, const Value& value, uint32_t encoding) {
    switch (value.kind) {
    case Value::Kind::kInteger:
        return sqlite3_bind_int64(statement, index, value.integer);
    case Value::Kind::kReal:
        return sqlite3_bind_double(statement, index, value.real);
    case Value::Kind::kText:
        return bindText(statement, index, value, encoding);
    case Value::Kind::kBlob:
        return sqlite3_bind_blob64(statement, index, value.bytes, value.size, SQLITE_STATIC);
    default:
        return sqlite3_bind_null(statement, index);
    }
}

}  // namespace

TargetTable::TargetTable(sqlite3* db, const Definition& definition) : name_(definition.name), root_(definition.root) {
    readColumns(db);
}

// A virtual generated column stands in no record; a stored one does, but is not written.
void TargetTable::readColumns(sqlite3* db) {
    const Statement query = prepare(db, "SELECT name, type, hidden, pk = 1 AND type = 'INTEGER' COLLATE NOCASE AND "
                                        "(SELECT max(pk) FROM pragma_table_xinfo(?1)) = 1 "
                                        "FROM pragma_table_xinfo(?1) WHERE hidden <> 2");
    sqlite3_bind_text(query.get(), 1, name_.c_str(), -1, SQLITE_STATIC);
    std::string names = "rowid";
    std::string places = "?1";
    while (nextRow(query)) {
        const std::string type = textOf(query.get(), 1);
        const bool given = sqlite3_column_int(query.get(), 2) == 0;
        const bool alias = sqlite3_column_int(query.get(), 3) != 0;
        const bool integer = sqlite3_strlike("%INT%", type.c_str(), 0) == 0;
        columns_.push_back({alias, given && !alias, integer, sqlite3_stricmp(type.c_str(), "TEXT") == 0});
        if (columns_.back().written) {
            names += ", " + quoted(textOf(query.get(), 0));
            places += ", ?" + std::to_string(columns_.size() + 1);
        }
    }
    insert_ = prepare(db, "INSERT OR IGNORE INTO " + quoted(name_) + " (" + names + ") VALUES (" + places + ")");
}

bool TargetTable::fits(const Row& row) const {
    const auto fitting = [](const Column& column, const Value& value) {
        return value.kind == Value::Kind::kNull ||
               (!column.idAlias && (!column.integer || value.kind == Value::Kind::kInteger) &&
                (!column.text || value.kind == Value::Kind::kText));
    };
    return insert_ != nullptr &&
           std::equal(columns_.begin(), columns_.end(), row.values.begin(), row.values.end(), fitting);
}

int TargetTable::insert(const Row& row, uint32_t encoding, bool& added) {
    added = false;
    if (insert_ == nullptr) {
        return SQLITE_DONE;
    }
    sqlite3_clear_bindings(insert_.get());
    sqlite3_bind_int64(insert_.get(), 1, row.id);
    for (size_t i = 0; i < std::min(columns_.size(), row.values.size()); ++i) {
        if (columns_[i].written) {
            withMemory(bind(insert_.get(), static_cast<int>(i) + 2, row.values[i], encoding));
        }
    }
    const int status = sqlite3_step(insert_.get());
    sqlite3_reset(insert_.get());
    added = status == SQLITE_DONE && sqlite3_changes(sqlite3_db_handle(insert_.get())) > 0;
    rows_ += added ? 1 : 0;
    return status;
}

Database OpenScratch() {
    Database db;
    withMemory(sqlite3_open(":memory:", Adopt(db)));
    return db;
}

bool CanUse(sqlite3* db, const Definition& definition) {
    return define(db, definition.sql, "CREATE TABLE") == SQLITE_DONE &&
           prepare(db, "SELECT * FROM " + quoted(definition.name)) != nullptr;
}

Schema SchemaOfText(const std::string& sql) {
    const Database db = OpenScratch();
    return withMemory(sqlite3_exec(db.get(), sql.c_str(), nullptr, nullptr, nullptr)) == SQLITE_OK
               ? readSchema(db.get())
               : Schema();
}

Schema SchemaOfFile(const char* path) {
    std::ifstream file(path, std::ios::binary);
    return SchemaOfText({std::istreambuf_iterator<char>(file), {}});
}

bool CreateTables(sqlite3* db, const Schema& schema, std::vector<TargetTable>& tables) {
    for (const Definition& definition : schema) {
        const int status = definition.type == "table" ? define(db, definition.sql, "CREATE TABLE") : SQLITE_ERROR;
        if (status == SQLITE_DONE) {
            tables.emplace_back(db, definition);
        } else if (!isRefusal(status)) {
            return false;
        }
    }
    return true;
}

bool CreateIndexes(sqlite3* db, const Schema& schema) {
    return std::all_of(schema.begin(), schema.end(), [db](const Definition& definition) {
        const bool unique = sqlite3_strnicmp(definition.sql.c_str(), "CREATE UNIQUE", 13) == 0;
        const char* kind = unique ? "CREATE UNIQUE INDEX" : "CREATE INDEX";
        const int status = definition.type == "index" ? define(db, definition.sql, kind) : SQLITE_ERROR;
        return status == SQLITE_DONE || isRefusal(status);
    });
}

}  // namespace quor::salvage
