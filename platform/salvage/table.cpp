#include "platform/salvage/table.h"

#include <algorithm>

#include "platform/salvage/sql.h"

namespace quor::salvage {
namespace {

// A virtual generated column stands in no record; a stored one does, but is not written.
constexpr char kColumns[] = R"(
    SELECT name, type, hidden = 0 AS given,
           pk = 1 AND type = 'INTEGER' COLLATE NOCASE AND (SELECT max(pk) FROM pragma_table_xinfo(?1)) = 1 AS id_alias
    FROM pragma_table_xinfo(?1) WHERE hidden <> 2)";

int bindText(sqlite3_stmt* statement, int index, const Value& value, uint32_t encoding) {
    constexpr unsigned char kEncodings[] = {SQLITE_UTF8, SQLITE_UTF8, SQLITE_UTF16LE, SQLITE_UTF16BE};
    return sqlite3_bind_text64(statement, index, reinterpret_cast<const char*>(value.bytes), value.size, SQLITE_STATIC,
                               kEncodings[encoding]);
}

int bind(sqlite3_stmt* statement, int index, const Value& value, uint32_t encoding) {
    switch (value.kind) {
    case Value::Kind::Integer:
        return sqlite3_bind_int64(statement, index, value.integer);
    case Value::Kind::Real:
        return sqlite3_bind_double(statement, index, value.real);
    case Value::Kind::Text:
        return bindText(statement, index, value, encoding);
    case Value::Kind::Blob:
        return sqlite3_bind_blob64(statement, index, value.bytes, value.size, SQLITE_STATIC);
    default:
        return sqlite3_bind_null(statement, index);
    }
}

}  // namespace

Table::Table(sqlite3* db, const std::string& name) : name_(name) {
    readColumns(db);
}

void Table::readColumns(sqlite3* db) {
    const Statement query = Prepare(db, kColumns);
    sqlite3_bind_text(query.get(), 1, name_.c_str(), -1, SQLITE_STATIC);
    std::string names = "rowid";
    std::string places = "?1";
    while (NextRow(query)) {
        const std::string type = TextOf(query, 1);
        Column column{};
        column.idAlias = sqlite3_column_int(query.get(), 3) != 0;
        column.written = sqlite3_column_int(query.get(), 2) != 0 && !column.idAlias;
        column.integer = sqlite3_strlike("%INT%", type.c_str(), 0) == 0;
        column.text = sqlite3_stricmp(type.c_str(), "TEXT") == 0;
        columns_.push_back(column);
        if (column.written) {
            names += ", " + Quoted(TextOf(query, 0));
            places += ", ?" + std::to_string(columns_.size() + 1);
        }
    }
    insert_ = Prepare(db, "INSERT OR IGNORE INTO " + Quoted(name_) + " (" + names + ") VALUES (" + places + ")");
}

bool Table::Column::allows(Value::Kind kind) const {
    if (kind == Value::Kind::Null) {
        return true;
    }
    return !idAlias && (!integer || kind == Value::Kind::Integer) && (!text || kind == Value::Kind::Text);
}

bool Table::fits(const Row& row) const {
    const auto fitting = [](const Column& column, const Value& value) { return column.allows(value.kind); };
    return insert_ != nullptr &&
           std::equal(columns_.begin(), columns_.end(), row.values.begin(), row.values.end(), fitting);
}

int Table::insert(const Row& row, uint32_t encoding, bool& added) {
    added = false;
    if (insert_ == nullptr) {
        return SQLITE_DONE;
    }
    sqlite3_clear_bindings(insert_.get());
    sqlite3_bind_int64(insert_.get(), 1, row.id);
    for (size_t i = 0; i < std::min(columns_.size(), row.values.size()); ++i) {
        if (columns_[i].written) {
            WithMemory(bind(insert_.get(), static_cast<int>(i) + 2, row.values[i], encoding));
        }
    }
    const int status = sqlite3_step(insert_.get());
    sqlite3_reset(insert_.get());
    added = status == SQLITE_DONE && sqlite3_changes(sqlite3_db_handle(insert_.get())) > 0;
    rows_ += added ? 1 : 0;
    return status;
}

}  // namespace quor::salvage
