#include "platform/salvage/cells.h"

namespace quor::salvage {
namespace {

constexpr uint64_t kLongestRecord = 1000000000;  // SQLite's own limit

// Bytes of a record that its leaf page holds.
uint64_t localSize(uint64_t size, uint32_t usable) {
    const uint64_t most = usable - 35;
    if (size <= most) {
        return size;
    }
    const uint64_t least = (usable - 12) * 32 / 255 - 23;
    const uint64_t wanted = least + (size - least) % (usable - 4);
    return wanted <= most ? wanted : least;
}

}  // namespace

bool ReadVarint(Span& bytes, uint64_t& value) {
    value = 0;
    for (int i = 0; bytes.at < bytes.end && i < 9; ++i) {
        const uint8_t byte = *bytes.at++;
        if (i == 8) {
            value = value << 8U | byte;
            return true;
        }
        value = value << 7U | (byte & 0x7fU);
        if (byte < 0x80) {
            return true;
        }
    }
    return false;
}

std::optional<Cell> ReadCell(const uint8_t* page, uint32_t offset, uint32_t usable) {
    if (offset >= usable) {
        return std::nullopt;
    }
    Span bytes{page + offset, page + usable};
    Cell cell;
    uint64_t id = 0;
    if (!ReadVarint(bytes, cell.recordSize) || !ReadVarint(bytes, id)) {
        return std::nullopt;
    }
    if (cell.recordSize < 1 || cell.recordSize > kLongestRecord) {
        return std::nullopt;
    }
    const uint64_t local = localSize(cell.recordSize, usable);
    const uint64_t pointer = local < cell.recordSize ? 4 : 0;
    if (local + pointer > bytes.left()) {
        return std::nullopt;
    }
    cell.id = static_cast<int64_t>(id);
    cell.local = {bytes.at, bytes.at + local};
    cell.overflow = pointer != 0 ? Big32(cell.local.end) : 0;
    cell.end = cell.local.end + pointer;
    return cell;
}

}  // namespace quor::salvage
