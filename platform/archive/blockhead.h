// What is known of a block without expanding it.
#ifndef PLATFORM_ARCHIVE_BLOCKHEAD_H
#define PLATFORM_ARCHIVE_BLOCKHEAD_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/archive/columnhead.h"

namespace quor::archive {

constexpr uint64_t kMostRows = 8192;  // of a block

struct BlockHead {
    uint64_t rows = 0;
    int64_t first = 0;  // row numbers
    int64_t last = 0;
    ColumnHead ids;  // the row numbers as a column
    std::vector<ColumnHead> columns;
    size_t bloomColumn = SIZE_MAX;  // whose texts the filter is of
    uint64_t bloomSize = 0;
    uint64_t bloomChecksum = 0;

    bool hasBloom() const { return bloomColumn != SIZE_MAX; }
    bool gapless() const { return static_cast<uint64_t>(last) - static_cast<uint64_t>(first) == rows - 1; }
};

// With a checksum in front.
std::string BytesOf(const BlockHead& head);
// Of a block of a table with so many columns. Throws Damaged. The values in it belong to `bytes`.
BlockHead ReadBlockHead(std::string_view bytes, size_t columns);

}  // namespace quor::archive

#endif
