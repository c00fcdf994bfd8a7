// The rows of leaf pages.
#ifndef PLATFORM_SALVAGE_RECORDS_H
#define PLATFORM_SALVAGE_RECORDS_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "platform/salvage/cells.h"
#include "platform/salvage/pages.h"

namespace quor::salvage {

struct Value {
    enum class Kind { Null, Integer, Real, Text, Blob };
    Kind kind = Kind::Null;
    int64_t integer = 0;
    double real = 0;
    const uint8_t* bytes = nullptr;
    size_t size = 0;
};

struct Row {
    int64_t id = 0;
    std::vector<Value> values;
};

// Reads the records of leaf pages, following them to their overflow pages, each of which belongs to one record.
class RecordReader {
  public:
    // The pages that are taken for something are marked in `used`.
    RecordReader(const PageFile& file, std::vector<bool>& used) : file_(file), used_(used) {}

    // False when the record is broken, or `offset` is 0. Its values live until the next call.
    bool read(const Bytes& page, uint32_t offset, Row& row);

  private:
    bool collect(const Cell& cell);
    bool takeOverflow(uint32_t number);
    bool decode(Row& row) const;

    const PageFile& file_;
    std::vector<bool>& used_;
    Bytes record_;
    Bytes overflow_;
};

}  // namespace quor::salvage

#endif
