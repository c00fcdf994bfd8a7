#include "platform/archive/copying.h"

#include <vector>

#include "platform/archive/storage.h"

namespace quor::archive {
namespace {

struct Item {
    std::string type;
    std::string name;
    std::string sql;
};

std::vector<Item> items(sqlite3* db, const std::string& from) {
    const Statement query = Prepared(db, "SELECT type, name, sql FROM " + from);
    std::vector<Item> all;
    while (NextRow(db, query)) {
        all.push_back({TextOf(query, 0), TextOf(query, 1), TextOf(query, 2)});
    }
    return all;
}

// What stands for itself: neither SQLite's own, nor of logs, nor virtual.
constexpr char kOthers[] = "source.sqlite_schema WHERE name NOT LIKE 'sqlite\\_%' ESCAPE '\\'"
                           " AND sql NOT LIKE 'CREATE VIRTUAL%' AND tbl_name <> 'logs'"
                           " AND tbl_name NOT LIKE 'logs\\_%' ESCAPE '\\' AND type IN ('table', 'index', 'view')"
                           " ORDER BY type = 'view', type = 'index', rowid";

// A definition may come from a file of anybody's: it is one statement that defines, or it is refused.
void define(sqlite3* db, const std::string& sql) {
    const auto allowed = [](void*, int action, const char*, const char*, const char*, const char*) {
        return action == SQLITE_ATTACH || action == SQLITE_DETACH || action == SQLITE_CREATE_VTABLE ? SQLITE_DENY
                                                                                                    : SQLITE_OK;
    };
    sqlite3_set_authorizer(db, allowed, nullptr);
    const Statement statement = PrepareOnly(db, sql.c_str());
    const bool starts = sqlite3_strnicmp(sql.c_str(), "CREATE ", 7) == 0;
    const int status = statement != nullptr && starts ? sqlite3_step(statement.get()) : sqlite3_errcode(db);
    sqlite3_set_authorizer(db, nullptr, nullptr);
    Require(db, statement != nullptr && starts ? status : status != SQLITE_OK ? status : SQLITE_ERROR);
}

void copyRows(sqlite3* db, const std::string& table) {
    const Statement query = Prepared(db, "SELECT name FROM pragma_table_xinfo(?1, 'main') WHERE hidden = 0");
    sqlite3_bind_text64(query.get(), 1, table.data(), table.size(), SQLITE_STATIC, SQLITE_UTF8);
    std::string names;
    while (NextRow(db, query)) {
        names += (names.empty() ? "" : ", ") + QuotedName(TextOf(query, 0));
    }
    Run(db, "INSERT INTO main." + QuotedName(table) + " (" + names + ") SELECT " + names + " FROM source." +
                QuotedName(table));
}

bool hasTable(sqlite3* db, const std::string& schema, const std::string& name) {
    const Statement query = Prepared(db, "SELECT 1 FROM " + schema + ".sqlite_schema WHERE name = '" + name + "'");
    return NextRow(db, query);
}

// SQLite's own tables, of which it allows the rows to be written.
void copySequences(sqlite3* db) {
    if (hasTable(db, "main", "sqlite_sequence") && hasTable(db, "source", "sqlite_sequence")) {
        Run(db, "DELETE FROM main.sqlite_sequence WHERE name <> 'logs';"
                "INSERT INTO main.sqlite_sequence SELECT * FROM source.sqlite_sequence WHERE name <> 'logs'");
    }
}

}  // namespace

void CopyTables(sqlite3* db) {
    for (const Item& item : items(db, kOthers)) {
        define(db, item.sql);
        if (item.type == "table") {
            copyRows(db, item.name);
        }
    }
    copySequences(db);
}

void CopyForArchive(sqlite3* db) {
    CopyTables(db);
    Run(db, "CREATE TABLE main.logs_schema (type TEXT, name TEXT, sql TEXT);"
            "INSERT INTO main.logs_schema SELECT type, name, sql FROM source.sqlite_schema"
            " WHERE sql IS NOT NULL AND ((tbl_name = 'logs' AND type IN ('table', 'index')) OR type = 'trigger')");
    if (hasTable(db, "source", "sqlite_stat1")) {
        Run(db, "CREATE TABLE main.logs_statistics AS SELECT * FROM source.sqlite_stat1");
    }
    Run(db, "CREATE TABLE main.logs_archive (name TEXT PRIMARY KEY, value) WITHOUT ROWID;"
            "INSERT INTO main.logs_archive SELECT 'page_size', page_size FROM pragma_page_size('source')");
    if (hasTable(db, "source", "sqlite_sequence")) {
        Run(db, "INSERT INTO main.logs_archive SELECT 'sequence', seq FROM source.sqlite_sequence"
                " WHERE name = 'logs' AND typeof(seq) = 'integer'");
    }
}

void CreateTable(sqlite3* db) {
    for (const Item& item : items(db, "source.logs_schema WHERE type = 'table'")) {
        define(db, item.sql);
    }
}

void FinishTable(sqlite3* db) {
    for (const Item& item : items(db, "source.logs_schema WHERE type <> 'table' ORDER BY type = 'trigger', rowid")) {
        define(db, item.sql);
    }
    if (hasTable(db, "main", "sqlite_sequence")) {
        Run(db,
            "DELETE FROM main.sqlite_sequence WHERE name = 'logs';"
            "INSERT INTO main.sqlite_sequence SELECT 'logs', value FROM source.logs_archive WHERE name = 'sequence'");
    }
    if (hasTable(db, "source", "logs_statistics")) {
        Run(db, "ANALYZE main.sqlite_schema;"
                "INSERT INTO main.sqlite_stat1 SELECT * FROM source.logs_statistics");
    }
}

}  // namespace quor::archive
