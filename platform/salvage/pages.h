// The pages of a database file that may be damaged, with those of its write-ahead log over them.
#ifndef PLATFORM_SALVAGE_PAGES_H
#define PLATFORM_SALVAGE_PAGES_H

#include <cstdint>
#include <string>
#include <vector>

#include "platform/salvage/inputfile.h"
#include "platform/salvage/wal.h"

namespace quor::salvage {

using Bytes = std::vector<uint8_t>;

class PageFile {
  public:
    // False when the file cannot be opened or no page size fits it.
    bool open(const std::string& path);

    uint32_t pageSize() const { return pageSize_; }
    uint32_t usable() const { return pageSize_ - reserved_; }  // bytes of a page that SQLite uses
    uint32_t encoding() const { return encoding_; }            // 1 UTF-8, 2 UTF-16 little endian, 3 big endian
    uint32_t count() const { return count_; }
    uint32_t firstFree() const { return firstFree_; }  // trunk page of the free list; 0 when there is none or unknown

    // Pages are numbered from 1. False when the page is missing or cut off.
    bool read(uint32_t number, Bytes& page) const;

  private:
    void readHeader();
    void guessPageSize();

    InputFile file_;
    WriteAheadLog log_;
    uint32_t pageSize_ = 0;
    uint32_t reserved_ = 0;
    uint32_t encoding_ = 1;
    uint32_t count_ = 0;
    uint32_t firstFree_ = 0;
    bool headerRead_ = false;
};

}  // namespace quor::salvage

#endif
