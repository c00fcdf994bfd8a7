// Memory that only grows: records side by side in chunks, the later ones in a temporary file when there are many.
#ifndef PLATFORM_DB_ARENA_H
#define PLATFORM_DB_ARENA_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "platform/db/spill.h"

namespace quor {

class Arena {
  public:
    struct Position {
        uint32_t chunk = 0;
        uint32_t offset = 0;
    };

    // The record being built. It moves when reserve() has to.
    char* record() { return end_; }
    // Room for `size` bytes of that record, of which `kept` are written already. False when the temporary file cannot
    // grow; throws std::bad_alloc when memory cannot.
    bool reserve(size_t kept, size_t size) { return size <= room_ || grow(kept, size); }
    // Ends a record of `size` bytes and tells where it stands.
    Position commit(size_t size);
    // Ends the building. False when the temporary file cannot be read back.
    bool finish();

    const char* at(Position position) const { return chunks_[position.chunk].data + position.offset; }
    // The position behind a record, where the next one stands.
    Position after(Position position, size_t size) const;
    // A reader goes on from one chunk to another.
    void goOn(uint32_t from, uint32_t to) const;

  private:
    struct Chunk {
        char* data;
        uint32_t used;
        uint32_t size;
    };

    bool grow(size_t kept, size_t size);
    void addChunk(size_t kept, size_t size);
    void enlarge(size_t size);
    bool moveToFile(size_t kept, size_t size);
    bool spilling() const { return chunks_.size() > firstInFile_; }
    bool inFile(size_t chunk) const { return chunk >= firstInFile_; }

    std::vector<Chunk> chunks_;
    std::vector<CText> memory_;      // of the first chunks; behind them the buffer of those on their way to the file
    size_t firstInFile_ = SIZE_MAX;  // the chunks from this one on
    uint64_t memorySize_ = 0;
    SpillFile file_;
    char* end_ = nullptr;
    size_t room_ = 0;
};

}  // namespace quor

#endif
