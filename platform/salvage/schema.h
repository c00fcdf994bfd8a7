// The definitions of tables and indexes: where they are found, and the creation of what they define.
#ifndef PLATFORM_SALVAGE_SCHEMA_H
#define PLATFORM_SALVAGE_SCHEMA_H

#include <sqlite3.h>

#include <cstdint>
#include <string>
#include <vector>

#include "platform/salvage/table.h"

namespace quor::salvage {

// One definition of a schema.
struct Definition {
    std::string type;  // "table" or "index"
    std::string name;
    uint32_t root = 0;  // page of the damaged file; 0 when unknown
    std::string sql;
};
using Schema = std::vector<Definition>;

// The schema that a file of SQL makes; empty when it cannot be read or is wrong.
Schema SchemaOfFile(const char* path);
Schema SchemaOfText(const std::string& sql);

// Creates the table in a database without it; false unless it can be read then, as what is left of a definition may
// not.
bool CanUse(sqlite3* db, const Definition& definition);

// Creates the tables of a schema (its indexes are left for later) and describes them. A definition that is not a plain
// table, or an index that the rows do not allow, is skipped; false when the database cannot be written.
bool CreateTables(sqlite3* db, const Schema& schema, std::vector<Table>& tables);
bool CreateIndexes(sqlite3* db, const Schema& schema);

}  // namespace quor::salvage

#endif
