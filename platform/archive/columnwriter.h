// The values of one column of a block, gathered and encoded.
#ifndef PLATFORM_ARCHIVE_COLUMNWRITER_H
#define PLATFORM_ARCHIVE_COLUMNWRITER_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/archive/columnhead.h"
#include "platform/archive/compression.h"

namespace quor::archive {

// Takes a column for one of few values until it turns out to have many.
class ColumnWriter {
  public:
    // Copies the bytes.
    void add(const Cell& cell);
    size_t rows() const { return few_ ? codes_.size() : slots_.size(); }
    // A value that was added, valid until the next call of add() or clear().
    Cell at(size_t row) const;

    // Whether both hold the same values, told only where that is quickly known.
    bool sameAs(const ColumnWriter& other) const;
    // Appends the compressed bytes to `data`. The head is valid until clear() and knows no offset.
    ColumnHead encode(std::string& data, Compressor& compressor) const;
    // The distinct values; empty when there are many.
    Entries entries() const;
    // Whether all values are texts or NULL, and how many bytes they are together.
    bool onlyTexts() const { return onlyTexts_; }
    size_t bytes() const { return bytes_.size(); }

    void clear();

  private:
    struct Slot {
        Cell::Kind kind;
        uint32_t size;    // of its bytes
        uint64_t number;  // or where the bytes begin
        bool operator==(const Slot& other) const {
            return kind == other.kind && size == other.size && number == other.number;
        }
    };

    Slot store(const Cell& cell);
    Cell cellOf(const Slot& slot) const;
    bool addToFew(const Cell& cell);
    void becomeMany();
    Encoding encodingOfMany() const;
    std::string rawFew(ColumnHead& head) const;
    std::string rawMany(ColumnHead& head) const;

    bool few_ = true;
    bool onlyTexts_ = true;
    std::string bytes_;
    std::vector<Slot> values_;  // of few: the distinct ones
    std::vector<uint32_t> counts_;
    std::vector<uint16_t> codes_;
    std::vector<uint16_t> table_;  // code + 1 by the hash of the value
    std::vector<Slot> slots_;      // of many
};

}  // namespace quor::archive

#endif
