// One column of a block, expanded.
#ifndef PLATFORM_ARCHIVE_COLUMN_H
#define PLATFORM_ARCHIVE_COLUMN_H

#include <cstdint>
#include <string>
#include <unordered_set>
#include <vector>

#include "platform/archive/columnhead.h"

namespace quor::archive {

// Texts that come up again and again, kept as long as this, so that SQLite need not copy them.
class Keepsake {
  public:
    // The kept form of a text; null when there is no more room.
    const std::string* keep(std::string_view text);

  private:
    std::unordered_set<std::string> texts_;
    size_t bytes_ = 0;
};

class Column {
  public:
    // From the expanded bytes of a column with so many rows. Throws Damaged.
    Column(const ColumnHead& head, std::string raw, size_t rows);
    Column(const Column&) = delete;
    Column& operator=(const Column&) = delete;

    // The value of a row, valid as long as this.
    Cell at(size_t row) const;

    // Of a column of few values: which one a row has, and what they are.
    bool coded() const { return encoding_ == Encoding::Dictionary; }
    size_t code(size_t row) const;
    const Entries& entries() const { return entries_; }
    // Moves the texts of a column of few values where they last. False when not all of them are there.
    bool keep(Keepsake& keepsake);

    // Of a column of texts alone: all of them, each ended by a zero byte, and where each begins.
    bool texts() const { return encoding_ == Encoding::Texts; }
    const std::string& raw() const { return raw_; }
    const std::vector<uint32_t>& starts() const { return starts_; }

  private:
    void readCodes(const ColumnHead& head, size_t rows);
    void readIntegers(size_t rows);
    void readTexts(size_t rows);
    void readCells(size_t rows);

    Encoding encoding_;
    std::string raw_;
    Entries entries_;
    std::string_view codes_;
    bool wide_ = false;  // two bytes a code
    std::vector<int64_t> integers_;
    std::vector<uint32_t> starts_;  // of each text, and the end of the last
    std::vector<Cell> cells_;
};

}  // namespace quor::archive

#endif
