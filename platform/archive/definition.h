// The definition of a table "logs", plain or archived.
#ifndef PLATFORM_ARCHIVE_DEFINITION_H
#define PLATFORM_ARCHIVE_DEFINITION_H

#include <sqlite3.h>

#include <string>
#include <vector>

namespace quor::archive {

struct ColumnDefinition {
    std::string name;
    std::string type;
    std::string collation;
    bool generated = false;
    bool id = false;       // stands for the row number
    bool indexed = false;  // its distinct values come in their order
};
using Definition = std::vector<ColumnDefinition>;

// Of the table in that schema of the connection. Throws Refused when there is none.
Definition ReadDefinition(sqlite3* db, const std::string& schema);

// "CREATE VIRTUAL TABLE ...", for an archive of a table with these columns.
std::string ArchiveDefinition(const Definition& columns);
// "SELECT rowid, ... FROM schema.logs ORDER BY rowid"
std::string EveryRow(const Definition& columns, const std::string& schema);
// The names of those that a row can be inserted with besides its number, each after a comma.
std::string WrittenNames(const Definition& columns);

}  // namespace quor::archive

#endif
