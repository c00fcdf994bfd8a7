// What the head of a block says of one column: how it is kept, where, and what it can hold.
#ifndef PLATFORM_ARCHIVE_COLUMNHEAD_H
#define PLATFORM_ARCHIVE_COLUMNHEAD_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/archive/cell.h"

namespace quor::archive {

enum class Encoding : uint8_t {
    Constant = 0,    // one value for all rows, in the head
    Same = 1,        // as an earlier column
    Dictionary = 2,  // few values, and which one each row has
    Integers = 3,    // the difference of each to the one before
    Texts = 4,       // one after another, each ended by a zero byte and without another
    Cells = 5,       // anything
};

// A value and how many rows have it.
struct Entry {
    Cell cell;
    uint64_t rows = 0;
};
using Entries = std::vector<Entry>;

// Between which values all of a column are, as far as that is known.
struct Range {
    enum class Kind : uint8_t { Unknown = 0, Integers = 1, Texts = 2, TextsFrom = 3 };  // of the last no upper end

    Kind kind = Kind::Unknown;
    int64_t least = 0;
    int64_t most = 0;
    std::string leastText;  // these two may be cut or lengthened, so that all texts are still between them
    std::string mostText;

    bool texts() const { return kind == Kind::Texts || kind == Kind::TextsFrom; }
};

struct ColumnHead {
    Encoding encoding = Encoding::Constant;
    size_t same = 0;          // the column that it equals
    Cell constant;            // of a Constant
    size_t entries = 0;       // of a Dictionary
    bool dictionary = false;  // the values stand here, not with the rows
    Entries values;           // if so
    Range range;
    uint64_t offset = 0;  // of the compressed bytes in the data of the block
    uint64_t size = 0;
    uint64_t expanded = 0;
    uint64_t checksum = 0;  // of the compressed bytes

    bool hasBytes() const { return encoding > Encoding::Same; }
};

void PutEntries(std::string& out, const Entries& entries);
Entries TakeEntries(Bytes& bytes, size_t count, uint64_t rows);

void PutColumnHead(std::string& out, const ColumnHead& head);
// The head of column `number` of a block with so many rows; `offset` is moved behind its data.
ColumnHead TakeColumnHead(Bytes& bytes, size_t number, uint64_t rows, uint64_t& offset);

// The range of these values.
Range RangeOf(const Entries& entries);
// Widens a range by a text, when it is one of texts.
void Widen(Range& range, const Cell& cell, bool first);
// Cuts the texts of a range to what a head should hold.
void Shorten(Range& range);

}  // namespace quor::archive

#endif
