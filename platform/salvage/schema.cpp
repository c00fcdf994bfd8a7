#include "platform/salvage/schema.h"

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>

#include "platform/salvage/sql.h"

namespace quor::salvage {
namespace {

// Definitions come from a file that may be hostile: they may define, and nothing else.
int allowDefinitions(void* /*context*/, int action, const char*, const char*, const char*, const char*) {
    return action == SQLITE_SELECT || action == SQLITE_ATTACH || action == SQLITE_CREATE_VTABLE ? SQLITE_DENY
                                                                                                : SQLITE_OK;
}

int define(sqlite3* db, const std::string& sql, const char* kind) {
    if (sqlite3_strnicmp(sql.c_str(), kind, static_cast<int>(strlen(kind))) != 0) {
        return SQLITE_ERROR;
    }
    sqlite3_set_authorizer(db, allowDefinitions, nullptr);
    const Statement statement = Prepare(db, sql);
    const int status = statement != nullptr ? sqlite3_step(statement.get()) : sqlite3_errcode(db);
    sqlite3_set_authorizer(db, nullptr, nullptr);
    return WithMemory(status);
}

// The fault lies with the definition, or with rows that are not unique.
bool isRefusal(int status) {
    constexpr int kRefusals[] = {SQLITE_ERROR, SQLITE_AUTH, SQLITE_CONSTRAINT, SQLITE_TOOBIG};
    return std::find(std::begin(kRefusals), std::end(kRefusals), status & 0xff) != std::end(kRefusals);
}

Schema readSchema(sqlite3* db) {
    Schema schema;
    const Statement query = Prepare(db, "SELECT type, name, sql FROM sqlite_master WHERE sql IS NOT NULL");
    while (NextRow(query)) {
        schema.push_back({TextOf(query, 0), TextOf(query, 1), 0, TextOf(query, 2)});
    }
    return schema;
}

}  // namespace

bool CanUse(sqlite3* db, const Definition& definition) {
    return define(db, definition.sql, "CREATE TABLE") == SQLITE_DONE &&
           Prepare(db, "SELECT * FROM " + Quoted(definition.name)) != nullptr;
}

Schema SchemaOfText(const std::string& sql) {
    const Database db = OpenScratch();
    return WithMemory(sqlite3_exec(db.get(), sql.c_str(), nullptr, nullptr, nullptr)) == SQLITE_OK
               ? readSchema(db.get())
               : Schema();
}

Schema SchemaOfFile(const char* path) {
    std::ifstream file(path, std::ios::binary);
    return SchemaOfText({std::istreambuf_iterator<char>(file), {}});
}

bool CreateTables(sqlite3* db, const Schema& schema, std::vector<Table>& tables) {
    for (const Definition& definition : schema) {
        const int status = definition.type == "table" ? define(db, definition.sql, "CREATE TABLE") : SQLITE_ERROR;
        if (status == SQLITE_DONE) {
            tables.emplace_back(db, definition.name);
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
