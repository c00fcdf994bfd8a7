// B-tree pages of tables and the records in them, read with every length checked.
#ifndef PLATFORM_SALVAGE_CELLS_H
#define PLATFORM_SALVAGE_CELLS_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "platform/salvage/pages.h"

namespace quor::salvage {

struct Value {
    enum class Kind { kNull, kInteger, kReal, kText, kBlob };
    Kind kind = Kind::kNull;
    int64_t integer = 0;
    double real = 0;
    const uint8_t* bytes = nullptr;
    size_t size = 0;
};

struct Row {
    int64_t id = 0;
    std::vector<Value> values;
};

// A page of a table's tree.
class TreePage {
  public:
    // `page` must outlive this; page 1 starts with the header of the file.
    TreePage(const Bytes& page, uint32_t number, uint32_t usable);

    bool isLeaf() const { return type_ == 0x0d; }
    bool isInterior() const { return type_ == 0x05; }
    uint32_t cells() const { return cells_; }
    // Where a cell stands; 0 when its pointer is wrong.
    uint32_t cell(uint32_t index) const;
    // Pages below an interior page, in order.
    std::vector<uint32_t> children() const;

  private:
    const Bytes& page_;
    uint32_t usable_;
    uint32_t pointers_ = 0;
    uint32_t cells_ = 0;
    uint8_t type_ = 0;
};

// Reads the records of leaf pages, following them to their overflow pages, each of which belongs to one record.
class RecordReader {
  public:
    RecordReader(const PageFile& file, std::vector<bool>& used) : file_(file), used_(used) {}

    // False when the record is broken. Its values live until the next call.
    bool read(const Bytes& page, uint32_t offset, Row& row);

  private:
    bool collect(const uint8_t* at, const uint8_t* end, uint64_t size);
    bool collectOverflow(uint32_t next, uint64_t size);
    bool decode(Row& row) const;

    const PageFile& file_;
    std::vector<bool>& used_;
    Bytes payload_;
    Bytes overflow_;
};

// Whether these bytes are a leaf page of a table whose cells reach to its end.
bool IsFullLeaf(const uint8_t* page, size_t size);

}  // namespace quor::salvage

#endif
