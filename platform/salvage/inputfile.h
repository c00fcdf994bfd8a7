// A file that may be damaged, read at any place.
#ifndef PLATFORM_SALVAGE_INPUTFILE_H
#define PLATFORM_SALVAGE_INPUTFILE_H

#include <cstddef>
#include <cstdint>
#include <string>

#include "base/guards.h"

namespace quor::salvage {

class InputFile {
  public:
    // False for anything but a regular file.
    bool open(const std::string& path);
    uint64_t size() const { return size_; }
    // Bytes read; fewer than `size` at the end of the file or where it cannot be read.
    size_t read(uint64_t offset, uint8_t* out, size_t size) const;

  private:
    Descriptor file_;
    uint64_t size_ = 0;
};

}  // namespace quor::salvage

#endif
