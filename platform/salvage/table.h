// A table of the new database, as the records of the damaged one fill it.
#ifndef PLATFORM_SALVAGE_TABLE_H
#define PLATFORM_SALVAGE_TABLE_H

#include <sqlite3.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/db/statement.h"
#include "platform/salvage/records.h"

namespace quor::salvage {

class Table {
  public:
    Table(sqlite3* db, const std::string& name);

    const std::string& name() const { return name_; }
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

        bool allows(Value::Kind kind) const;
    };

    void readColumns(sqlite3* db);

    std::string name_;
    uint64_t rows_ = 0;
    std::vector<Column> columns_;
    Statement insert_;
};

}  // namespace quor::salvage

#endif
