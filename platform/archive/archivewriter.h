// The rows of a table, made into blocks one after another.
#ifndef PLATFORM_ARCHIVE_ARCHIVEWRITER_H
#define PLATFORM_ARCHIVE_ARCHIVEWRITER_H

#include <map>
#include <optional>
#include <string>
#include <vector>

#include "platform/archive/audit.h"
#include "platform/archive/blockwriter.h"
#include "platform/archive/definition.h"
#include "platform/archive/rowsum.h"
#include "platform/archive/storage.h"

namespace quor::archive {

class ArchiveWriter {
  public:
    ArchiveWriter(sqlite3* db, Definition columns);

    // Writes schema "source" of the connection to "main", which is empty.
    Tally write(const Progress& progress);

  private:
    // How often each value of a column occurs, by its written form; nothing when there are too many.
    using Values = std::optional<std::map<std::string, uint64_t>>;

    void writeRows(const Progress& progress);
    void addRow(sqlite3_stmt* row);
    void finishBlock();
    void count(size_t column);
    void writeValues();

    sqlite3* db_;
    Definition columns_;
    Storage storage_;
    BlockWriter block_;
    RowSum sum_;
    Tally tally_;
    std::vector<Values> values_;
    std::vector<Cell> cells_;  // of the row at hand
};

}  // namespace quor::archive

#endif
