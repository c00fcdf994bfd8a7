#include "platform/archive/definition.h"

#include <algorithm>
#include <cctype>

#include "platform/archive/storage.h"

namespace quor::archive {
namespace {

constexpr char kColumns[] = R"(
    SELECT name, type, hidden <> 0 AS generated,
           pk = 1 AND type = 'INTEGER' COLLATE NOCASE
               AND (SELECT max(pk) FROM pragma_table_xinfo('logs', ?1)) = 1 AS id,
           EXISTS (SELECT 1 FROM pragma_index_list('logs', ?1) AS list, pragma_index_info(list.name, ?1) AS info
                   WHERE list.partial = 0 AND info.seqno = 0 AND info.name = columns.name) AS indexed
    FROM pragma_table_xinfo('logs', ?1) AS columns)";

// Words that a type is usually made of; of another one nothing is said.
std::string plainType(const std::string& type) {
    const bool plain = std::all_of(type.begin(), type.end(), [](char c) {
        return isalnum(static_cast<unsigned char>(c)) != 0 || c == ' ' || c == '_';
    });
    return plain ? type : "";
}

std::string collationOf(sqlite3* db, const std::string& schema, const std::string& column) {
    const char* collation = nullptr;
    (void)sqlite3_table_column_metadata(db, schema.c_str(), "logs", column.c_str(), nullptr, &collation, nullptr,
                                        nullptr, nullptr);
    return collation != nullptr && sqlite3_stricmp(collation, "BINARY") != 0 ? collation : "";
}

std::string definitionOf(const ColumnDefinition& column) {
    return QuotedName(column.name) + (column.type.empty() ? "" : " " + column.type) +
           (column.collation.empty() ? "" : " COLLATE " + QuotedName(column.collation)) +
           (column.id ? " PRIMARY KEY" : "");
}

}  // namespace

Definition ReadDefinition(sqlite3* db, const std::string& schema) {
    const Statement query = Prepared(db, kColumns);
    sqlite3_bind_text64(query.get(), 1, schema.data(), schema.size(), SQLITE_STATIC, SQLITE_UTF8);
    Definition columns;
    while (NextRow(db, query)) {
        ColumnDefinition column;
        column.name = TextOf(query, 0);
        column.type = plainType(TextOf(query, 1));
        column.collation = collationOf(db, schema, column.name);
        column.generated = sqlite3_column_int(query.get(), 2) != 0;
        column.id = sqlite3_column_int(query.get(), 3) != 0;
        column.indexed = sqlite3_column_int(query.get(), 4) != 0;
        columns.push_back(column);
    }
    return columns;
}

std::string ArchiveDefinition(const Definition& columns) {
    std::string sql = "CREATE VIRTUAL TABLE main.logs USING quorarchive(";
    for (const ColumnDefinition& column : columns) {
        sql += (&column == columns.data() ? "" : ", ") + definitionOf(column);
    }
    return sql + ")";
}

std::string EveryRow(const Definition& columns, const std::string& schema) {
    std::string sql = "SELECT rowid";
    for (const ColumnDefinition& column : columns) {
        sql += ", " + QuotedName(column.name);
    }
    return sql + " FROM " + QuotedName(schema) + ".logs ORDER BY rowid";
}

std::string WrittenNames(const Definition& columns) {
    std::string names;
    for (const ColumnDefinition& column : columns) {
        names += column.generated || column.id ? "" : ", " + QuotedName(column.name);
    }
    return names;
}

}  // namespace quor::archive
