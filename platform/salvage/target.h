// The new database that salvaged rows are written to.
#ifndef PLATFORM_SALVAGE_TARGET_H
#define PLATFORM_SALVAGE_TARGET_H

#include <sqlite3.h>

#include <cstdint>
#include <string>
#include <vector>

#include "platform/db/statement.h"
#include "platform/salvage/cells.h"

namespace quor::salvage {

using Database = Guard<sqlite3, sqlite3_close_v2>;  // tables may still hold statements of theirs

// One definition of a schema.
struct Definition {
    std::string type;  // "table" or "index"
    std::string name;
    uint32_t root = 0;  // page of the damaged file; 0 when unknown
    std::string sql;
};
using Schema = std::vector<Definition>;

// A table's columns as its records hold them.
class TargetTable {
  public:
    TargetTable(sqlite3* db, const Definition& definition);

    const std::string& name() const { return name_; }
    uint32_t root() const { return root_; }
    uint64_t rows() const { return rows_; }
    size_t columns() const { return columns_.size(); }
    // Whether a record that nothing refers to looks like one of this table.
    bool fits(const Row& row) const;
    // SQLITE_DONE, also when a row was there before: then `added` is false. `encoding` is that of the damaged file.
    int insert(const Row& row, uint32_t encoding, bool& added);

  private:
    struct Column {
        bool idAlias;  // NULL in a record: the row's number stands for it
        bool written;
        bool integer;  // holds numbers only
        bool text;     // holds texts only
    };

    void readColumns(sqlite3* db);

    std::string name_;
    uint32_t root_;
    uint64_t rows_ = 0;
    std::vector<Column> columns_;
    Statement insert_;
};

// The schema that a file of SQL makes; empty when it cannot be read or is wrong.
Schema SchemaOfFile(const char* path);
Schema SchemaOfText(const std::string& sql);

// A database in memory.
Database OpenScratch();

// Creates the table in a database without it; false unless it can be read then, as what is left of a definition may
// not.
bool CanUse(sqlite3* db, const Definition& definition);

// Creates the tables of a schema (its indexes are left for later) and describes them. A definition that is not a plain
// table, or an index that the rows do not allow, is skipped; false when the database cannot be written.
bool CreateTables(sqlite3* db, const Schema& schema, std::vector<TargetTable>& tables);
bool CreateIndexes(sqlite3* db, const Schema& schema);

}  // namespace quor::salvage

#endif
