#include "platform/db/arena.h"

#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>

namespace quor {
namespace {

constexpr size_t kFirstChunk = 16U << 10U;  // a page of a search
constexpr size_t kLargestChunk = 4U << 20U;
constexpr uint64_t kMemoryBudget = 64U << 20U;
constexpr uint64_t kShareOfMemory = 16;  // on a small machine

uint64_t memoryBudget() {
    const auto pages = static_cast<uint64_t>(sysconf(_SC_PHYS_PAGES));
    const auto pageSize = static_cast<uint64_t>(sysconf(_SC_PAGESIZE));
    return std::min(kMemoryBudget, pages * pageSize / kShareOfMemory);
}

// Large chunks ask for large pages: filling memory page by page costs as much as copying the texts.
CText allocate(size_t size) {
    constexpr size_t kLargePage = 2U << 20U;
    const bool large = size % kLargePage == 0;
    CText memory(static_cast<char*>(large ? aligned_alloc(kLargePage, size) : malloc(size)));
    if (memory == nullptr) {
        throw std::bad_alloc();
    }
    if (large) {
        madvise(memory.get(), size, MADV_HUGEPAGE);
    }
    return memory;
}

char* resize(CText& memory, size_t size) {
    void* moved = realloc(memory.get(), size);
    if (moved == nullptr) {
        throw std::bad_alloc();
    }
    (void)memory.release();
    memory.reset(static_cast<char*>(moved));
    return memory.get();
}

}  // namespace

bool Arena::grow(size_t kept, size_t size) {
    if (size > UINT32_MAX) {
        return false;
    }
    if (!chunks_.empty() && chunks_.back().used == 0) {
        enlarge(size);
        return true;
    }
    if (spilling()) {
        return moveToFile(kept, size);
    }
    addChunk(kept, size);
    return true;
}

// Larger and larger, so that a small result stays small. The first chunk that is too much for memory becomes the buffer
// of all that follow.
void Arena::addChunk(size_t kept, size_t size) {
    const size_t next =
        chunks_.empty() ? kFirstChunk : std::min<size_t>(kLargestChunk, chunks_.back().size * size_t{2});
    const size_t taken = std::max(size, next);
    chunks_.reserve(chunks_.size() + 1);
    char* data = memory_.emplace_back(allocate(taken)).get();
    if (kept > 0) {
        memcpy(data, end_, kept);
    }
    if (memorySize_ + taken > memoryBudget()) {
        firstInFile_ = chunks_.size();
    }
    memorySize_ += taken;
    chunks_.push_back({data, 0, static_cast<uint32_t>(taken)});
    end_ = data;
    room_ = taken;
}

// The record is alone in its chunk.
void Arena::enlarge(size_t size) {
    Chunk& chunk = chunks_.back();
    const size_t taken = std::max(size, std::min<size_t>(UINT32_MAX, chunk.size * size_t{2}));
    chunk.data = end_ = resize(memory_.back(), taken);
    chunk.size = static_cast<uint32_t>(taken);
    room_ = taken;
}

// Writes the full buffer and starts the next chunk in it.
bool Arena::moveToFile(size_t kept, size_t size) {
    char* buffer = memory_.back().get();
    Chunk& full = chunks_.back();
    if (!file_.write(buffer, full.used)) {
        return false;
    }
    memmove(buffer, end_, kept);
    full.data = nullptr;
    chunks_.push_back({buffer, 0, full.size});
    end_ = buffer;
    room_ = chunks_.back().size;
    return reserve(kept, size);
}

Arena::Position Arena::commit(size_t size) {
    Chunk& chunk = chunks_.back();
    const Position position{static_cast<uint32_t>(chunks_.size() - 1), chunk.used};
    chunk.used += static_cast<uint32_t>(size);
    end_ += size;
    room_ -= size;
    return position;
}

bool Arena::finish() {
    if (chunks_.empty()) {
        return true;
    }
    Chunk& last = chunks_.back();
    if (!spilling()) {
        last.data = resize(memory_.back(), std::max<size_t>(last.used, 1));
        return true;
    }
    if (!file_.write(last.data, last.used)) {
        return false;
    }
    memory_.pop_back();
    char* data = file_.map();
    for (size_t i = firstInFile_; i < chunks_.size(); ++i) {
        chunks_[i].data = data;
        data += chunks_[i].used;
    }
    return chunks_[firstInFile_].data != nullptr;
}

Arena::Position Arena::after(Position position, size_t size) const {
    position.offset += static_cast<uint32_t>(size);
    if (position.offset == chunks_[position.chunk].used) {
        return {position.chunk + 1, 0};
    }
    return position;
}

void Arena::goOn(uint32_t from, uint32_t to) const {
    if (inFile(from)) {
        file_.drop(chunks_[from].data, chunks_[from].used);
    }
    if (inFile(to)) {
        file_.fetch(chunks_[to].data, chunks_[to].used);
    }
}

}  // namespace quor
