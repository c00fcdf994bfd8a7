// Finding the rows of a damaged database: its tables' trees first, then, where they are broken, every page on its own.
#ifndef PLATFORM_SALVAGE_ROWSAVER_H
#define PLATFORM_SALVAGE_ROWSAVER_H

#include <cstddef>
#include <cstdint>
#include <functional>
#include <vector>

#include "platform/salvage/pages.h"
#include "platform/salvage/records.h"
#include "platform/salvage/schema.h"
#include "platform/salvage/table.h"
#include "platform/salvage/tree.h"
#include "quor/quorsalvage.h"

namespace quor::salvage {

class RowSaver {
  public:
    RowSaver(const PageFile& file, QUORSALVAGEPROGRESS progress, void* context, QUORSALVAGE& report);

    // Finds the definitions; false when neither the file nor a schema gives tables for its rows.
    bool findSchema(const char* const* schemas);
    // Fills the new database; false when it cannot be written or the caller gave up.
    bool fill(sqlite3* db);
    bool gaveUp() const { return gaveUp_; }

  private:
    // Takes each row of a page; false ends the walk.
    using Taker = std::function<bool(const Row& row)>;

    bool walk(uint32_t root, const Taker& take);
    bool visit(uint32_t number, std::vector<uint32_t>& next, const Taker& take);
    bool readUnused(uint32_t number, Bytes& page) const;
    bool readLeaf(const Bytes& page, const TreePage& leaf, const Taker& take);
    bool readSchema();
    bool dropUnusable();
    size_t sample(const Schema& schema);
    bool saveTree(const Definition& definition);
    bool saveStrays();
    bool saveStray(const Row& row);
    bool save(Table& table, const Row& row, bool& added);
    void markFree();
    bool tick();
    bool tell(uint64_t done);

    const PageFile& file_;
    QUORSALVAGEPROGRESS progress_;
    void* context_;
    QUORSALVAGE& report_;
    std::vector<bool> used_;  // pages that were taken for something
    RecordReader reader_;
    Schema schema_;
    std::vector<Table> tables_;
    uint64_t done_ = 0;
    bool gaveUp_ = false;
};

}  // namespace quor::salvage

#endif
