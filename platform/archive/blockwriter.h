// Rows gathered and made into a block.
#ifndef PLATFORM_ARCHIVE_BLOCKWRITER_H
#define PLATFORM_ARCHIVE_BLOCKWRITER_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/archive/blockhead.h"
#include "platform/archive/columnwriter.h"
#include "platform/archive/trigrams.h"

namespace quor::archive {

struct BlockBytes {
    std::string head;
    std::string data;
    std::string bloom;  // empty for a block without
};

class BlockWriter {
  public:
    explicit BlockWriter(size_t columns) : columns_(columns) {}

    bool empty() const { return ids_.empty(); }
    // Whether a row of so many bytes should begin another block.
    bool full(size_t bytes) const;
    // Rows come in the order of their numbers. Each value is given by itself.
    void beginRow(int64_t id);
    void addCell(size_t column, const Cell& cell);

    int64_t first() const { return ids_.front(); }
    const ColumnWriter& column(size_t number) const { return columns_[number]; }
    // What the rows are as a block; clear() begins the next one.
    BlockBytes finish();
    void clear();

  private:
    size_t bloomColumn() const;
    std::string bloomOf(size_t column);
    std::vector<ColumnHead> encodeColumns(std::string& data);

    std::vector<int64_t> ids_;
    ColumnWriter idColumn_;
    std::vector<ColumnWriter> columns_;
    size_t bytes_ = 0;
    Compressor compressor_;
    TrigramSet trigrams_;
};

}  // namespace quor::archive

#endif
