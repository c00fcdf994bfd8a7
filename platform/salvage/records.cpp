#include "platform/salvage/records.h"

#include <algorithm>
#include <cstring>
#include <optional>

namespace quor::salvage {
namespace {

constexpr size_t kMostColumns = 32767;  // SQLite's own limit

// What a record says of each value, and how long the value is.
enum Type : uint64_t { kNull = 0, kReal = 7, kOne = 9, kReserved = 10, kFirstBlob = 12 };

// False for the types that SQLite keeps to itself.
bool sizeOf(uint64_t type, uint64_t& size) {
    constexpr uint8_t kSizes[kReserved] = {0, 1, 2, 3, 4, 6, 8, 8, 0, 0};
    if (type >= kReserved && type < kFirstBlob) {
        return false;
    }
    size = type < kReserved ? kSizes[type] : (type - kFirstBlob) / 2;
    return true;
}

int64_t readInteger(const uint8_t* at, size_t size) {
    uint64_t value = size > 0 && at[0] >= 0x80 ? UINT64_MAX : 0;
    for (size_t i = 0; i < size; ++i) {
        value = value << 8U | at[i];
    }
    return static_cast<int64_t>(value);
}

Value toValue(uint64_t type, const uint8_t* at, size_t size) {
    Value value;
    if (type >= kFirstBlob) {
        value.kind = type % 2 == 0 ? Value::Kind::Blob : Value::Kind::Text;
        value.bytes = at;
        value.size = size;
    } else if (type == kReal) {
        const int64_t bits = readInteger(at, size);
        value.kind = Value::Kind::Real;
        memcpy(&value.real, &bits, sizeof value.real);
    } else if (type != kNull) {
        value.kind = Value::Kind::Integer;
        value.integer = type == kOne ? 1 : readInteger(at, size);
    }
    return value;
}

}  // namespace

bool RecordReader::read(const Bytes& page, uint32_t offset, Row& row) {
    const std::optional<Cell> cell = offset != 0 ? ReadCell(page.data(), offset, file_.usable()) : std::nullopt;
    if (!cell) {
        return false;
    }
    row.id = cell->id;
    return collect(*cell) && decode(row);
}

// The bytes are taken as their pages come, so that a wrong size costs no more memory than the file has.
bool RecordReader::collect(const Cell& cell) {
    record_.assign(cell.local.at, cell.local.end);
    uint32_t next = cell.overflow;
    while (record_.size() < cell.recordSize) {
        if (!takeOverflow(next)) {
            return false;
        }
        const uint64_t size = std::min<uint64_t>(cell.recordSize - record_.size(), file_.usable() - 4);
        record_.insert(record_.end(), overflow_.data() + 4, overflow_.data() + 4 + size);
        next = Big32(overflow_.data());
    }
    return next == 0;
}

// A page of zeros was wiped: texts hold none.
bool RecordReader::takeOverflow(uint32_t number) {
    if (number == 0 || number > file_.count() || used_[number] || !file_.read(number, overflow_)) {
        return false;
    }
    const auto isZero = [](uint8_t byte) { return byte == 0; };
    used_[number] = !std::all_of(overflow_.begin(), overflow_.end(), isZero);
    return used_[number];
}

// The header's types must account for every byte of the record.
bool RecordReader::decode(Row& row) const {
    Span header{record_.data(), record_.data() + record_.size()};
    Span body = header;
    uint64_t size = 0;
    if (!ReadVarint(header, size) || size < 1 || size > record_.size()) {
        return false;
    }
    header.end = body.at = record_.data() + size;
    row.values.clear();
    while (header.at < header.end) {
        uint64_t type = 0;
        if (!ReadVarint(header, type) || !sizeOf(type, size)) {
            return false;
        }
        if (size > body.left() || row.values.size() == kMostColumns) {
            return false;
        }
        row.values.push_back(toValue(type, body.at, static_cast<size_t>(size)));
        body.at += size;
    }
    return body.left() == 0 && !row.values.empty();
}

}  // namespace quor::salvage
