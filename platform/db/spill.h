// A temporary file without a name, for a result that memory should not hold.
#ifndef PLATFORM_DB_SPILL_H
#define PLATFORM_DB_SPILL_H

#include <cstddef>
#include <cstdint>
#include <memory>

#include "base/guards.h"

namespace quor {

class SpillFile {
  public:
    // Appends, creating the file when it is first needed. False when there is no room for it.
    bool write(const char* data, size_t size);
    // The whole file in memory, read page by page when it is touched; null when it does not fit the address space.
    // It stays until the destructor runs, and nothing can be appended any more.
    char* map();
    // Gives the memory of a part back; it is read again when it is touched.
    void drop(const char* data, size_t size) const;
    // Brings a part in at once, which costs far less than page by page.
    void fetch(const char* data, size_t size) const;

  private:
    void advise(const char* data, size_t size, int advice) const;

    struct Unmap {
        size_t size;
        void operator()(char* memory) const;
    };

    Descriptor file_;
    uint64_t size_ = 0;
    std::unique_ptr<char, Unmap> map_{nullptr, Unmap{0}};
};

}  // namespace quor

#endif
