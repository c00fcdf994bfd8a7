// Open files read and written to the last byte, whatever interrupts the calls.
#ifndef BASE_FILES_H
#define BASE_FILES_H

#include <cstddef>
#include <cstdint>
#include <string_view>

#include "base/guards.h"

namespace quor {

// False, with the cause in errno, when not everything could be written.
bool WriteAll(int file, std::string_view bytes);

// The number of bytes read; fewer than `size` at the end of the file or where it cannot be read.
size_t ReadAt(const Descriptor& file, uint64_t offset, void* out, size_t size);

}  // namespace quor

#endif
