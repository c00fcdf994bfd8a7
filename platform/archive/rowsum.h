// A checksum of rows that does not depend on their order, so that rows can be taken out of it again.
#ifndef PLATFORM_ARCHIVE_ROWSUM_H
#define PLATFORM_ARCHIVE_ROWSUM_H

#include <cstdint>
#include <string>

#include "platform/archive/cell.h"

namespace quor::archive {

class RowSum {
  public:
    void begin(int64_t id) {
        row_.clear();
        PutSigned(row_, id);
    }
    void add(const Cell& cell) { PutCell(row_, cell); }
    void end() { sum_ += Checksum(row_); }
    uint64_t value() const { return sum_; }

  private:
    std::string row_;
    uint64_t sum_ = 0;
};

}  // namespace quor::archive

#endif
