// Numbers and cells as the file format writes them, read with every length checked.
#ifndef PLATFORM_SALVAGE_CELLS_H
#define PLATFORM_SALVAGE_CELLS_H

#include <cstddef>
#include <cstdint>
#include <optional>

namespace quor::salvage {

inline uint32_t Big16(const uint8_t* at) {
    return static_cast<uint32_t>(at[0]) << 8U | at[1];
}
inline uint32_t Big32(const uint8_t* at) {
    return Big16(at) << 16U | Big16(at + 2);
}

// A power of two from 512 to 65536.
inline bool IsPageSize(uint32_t size) {
    return size >= 512 && size <= 65536 && (size & (size - 1)) == 0;
}

// Bytes that are read from the front.
struct Span {
    const uint8_t* at;
    const uint8_t* end;

    uint64_t left() const { return static_cast<uint64_t>(end - at); }
};

// Takes a number of up to nine bytes off the front. False when it goes on behind the end.
bool ReadVarint(Span& bytes, uint64_t& value);

// A cell of a leaf page: a row's number and the first bytes of its record, the others being on overflow pages.
struct Cell {
    int64_t id = 0;
    uint64_t recordSize = 0;
    Span local{};
    uint32_t overflow = 0;         // the first overflow page; 0 when there is none
    const uint8_t* end = nullptr;  // of the cell
};

// The cell at `offset` of a page with so many usable bytes; nothing when it does not fit there.
std::optional<Cell> ReadCell(const uint8_t* page, uint32_t offset, uint32_t usable);

}  // namespace quor::salvage

#endif
