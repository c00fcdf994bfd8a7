// The pages of a database file that may be damaged, with those of its write-ahead log over them.
#ifndef PLATFORM_SALVAGE_PAGES_H
#define PLATFORM_SALVAGE_PAGES_H

#include <cstddef>
#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

#include "base/guards.h"

namespace quor::salvage {

using Bytes = std::vector<uint8_t>;

inline uint32_t Big16(const uint8_t* at) {
    return static_cast<uint32_t>(at[0]) << 8U | at[1];
}
inline uint32_t Big32(const uint8_t* at) {
    return Big16(at) << 16U | Big16(at + 2);
}

// An open file, read at any place.
class InputFile {
  public:
    bool open(const std::string& path);
    uint64_t size() const { return size_; }
    // Bytes read; fewer than `size` at the end of the file or where it cannot be read.
    size_t read(uint64_t offset, uint8_t* out, size_t size) const;

  private:
    Descriptor file_;
    uint64_t size_ = 0;
};

class PageFile {
  public:
    // False when the file cannot be opened or no page size fits it.
    bool open(const std::string& path);

    uint32_t pageSize() const { return pageSize_; }
    uint32_t usable() const { return pageSize_ - reserved_; }  // bytes of a page that SQLite uses
    uint32_t encoding() const { return encoding_; }            // 1 UTF-8, 2 UTF-16 little endian, 3 big endian
    uint32_t count() const { return count_; }
    uint32_t firstFree() const { return firstFree_; }  // trunk page of the free list; 0 when there is none or unknown
    bool headerRead() const { return headerRead_; }

    // Pages are numbered from 1. False when the page is missing or cut off.
    bool read(uint32_t number, Bytes& page) const;

  private:
    void readHeader();
    void readLog(const std::string& path);
    void readFrames(bool bigEndian, uint32_t sum1, uint32_t sum2);
    void guessPageSize();

    InputFile file_;
    InputFile log_;
    std::unordered_map<uint32_t, uint64_t> frames_;  // page to its newest committed place in the log
    uint32_t pageSize_ = 0;
    uint32_t reserved_ = 0;
    uint32_t encoding_ = 1;
    uint32_t count_ = 0;
    uint32_t firstFree_ = 0;
    bool headerRead_ = false;
};

}  // namespace quor::salvage

#endif
