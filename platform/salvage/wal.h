// The write-ahead log of a database that may be damaged: the pages of its finished transactions.
#ifndef PLATFORM_SALVAGE_WAL_H
#define PLATFORM_SALVAGE_WAL_H

#include <cstdint>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "platform/salvage/inputfile.h"

namespace quor::salvage {

class WriteAheadLog {
  public:
    // Takes the log only when its header is whole and it has the page size of the database, which is 0 when unknown.
    void open(const std::string& path, uint32_t pageSize);

    uint32_t pageSize() const { return pageSize_; }  // 0 when no log was taken
    uint32_t pages() const { return pages_; }        // of the database, as far as the log knows
    bool has(uint32_t page) const { return places_.count(page) != 0; }
    // A page that it has. False when it cannot be read any more.
    bool read(uint32_t page, uint8_t* out) const;

  private:
    class Sums;

    void readFrames(Sums sums);
    void commit(const std::vector<std::pair<uint32_t, uint64_t>>& frames, uint32_t pages);

    InputFile file_;
    std::unordered_map<uint32_t, uint64_t> places_;  // of the newest committed form of each page
    uint32_t pageSize_ = 0;
    uint32_t pages_ = 0;
};

}  // namespace quor::salvage

#endif
