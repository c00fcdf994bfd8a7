#include "platform/salvage/cells.h"

#include <algorithm>
#include <cstring>

namespace quor::salvage {
namespace {

constexpr uint32_t kFileHeader = 100;
constexpr uint32_t kLeafHeader = 8;
constexpr uint32_t kInteriorHeader = 12;
constexpr uint64_t kLongestRecord = 1000000000;  // SQLite's own limits
constexpr size_t kMostColumns = 32767;

// Reads up to nine bytes. False when they run past the end.
bool readVarint(const uint8_t*& at, const uint8_t* end, uint64_t& value) {
    value = 0;
    for (int i = 0; at < end && i < 9; ++i) {
        const uint8_t byte = *at++;
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

// Bytes of a record that stand in its leaf page.
uint64_t localSize(uint64_t size, uint32_t usable) {
    const uint64_t most = usable - 35;
    if (size <= most) {
        return size;
    }
    const uint64_t least = (usable - 12) * 32 / 255 - 23;
    const uint64_t wanted = least + (size - least) % (usable - 4);
    return wanted <= most ? wanted : least;
}

int64_t readInteger(const uint8_t* at, size_t size) {
    uint64_t value = size > 0 && at[0] >= 0x80 ? UINT64_MAX : 0;
    for (size_t i = 0; i < size; ++i) {
        value = value << 8U | at[i];
    }
    return static_cast<int64_t>(value);
}

// Bytes of a value in the record's body; false for the types that SQLite keeps to itself.
bool bodySize(uint64_t type, uint64_t& size) {
    constexpr uint8_t kSizes[] = {0, 1, 2, 3, 4, 6, 8, 8, 0, 0};
    if (type == 10 || type == 11) {
        return false;
    }
    size = type < 10 ? kSizes[type] : (type - 12) / 2;
    return true;
}

Value toValue(uint64_t type, const uint8_t* at, size_t size) {
    Value value;
    if (type >= 12) {
        value.kind = type % 2 == 0 ? Value::Kind::kBlob : Value::Kind::kText;
        value.bytes = at;
        value.size = size;
    } else if (type == 7) {
        const int64_t bits = readInteger(at, size);
        value.kind = Value::Kind::kReal;
        memcpy(&value.real, &bits, sizeof value.real);
    } else if (type != 0) {
        value.kind = Value::Kind::kInteger;
        value.integer = type == 9 ? 1 : readInteger(at, size);
    }
    return value;
}

}  // namespace

TreePage::TreePage(const Bytes& page, uint32_t number, uint32_t usable) : page_(page), usable_(usable) {
    const uint32_t start = number == 1 ? kFileHeader : 0;
    const uint8_t type = page[start];
    const uint32_t header = type == 0x05 ? kInteriorHeader : kLeafHeader;
    const uint32_t cells = Big16(page.data() + start + 3);
    pointers_ = start + header;
    if ((type == 0x0d || type == 0x05) && pointers_ + 2 * cells <= usable) {
        type_ = type;
        cells_ = cells;
    }
}

uint32_t TreePage::cell(uint32_t index) const {
    const uint32_t offset = Big16(page_.data() + pointers_ + size_t{2} * index);
    return offset >= pointers_ + 2 * cells_ && offset + 4 <= usable_ ? offset : 0;
}

std::vector<uint32_t> TreePage::children() const {
    std::vector<uint32_t> pages;
    for (uint32_t i = 0; i < cells_; ++i) {
        pages.push_back(cell(i) != 0 ? Big32(page_.data() + cell(i)) : 0);
    }
    pages.push_back(Big32(page_.data() + pointers_ - 4));
    return pages;
}

bool RecordReader::read(const Bytes& page, uint32_t offset, Row& row) {
    const uint8_t* at = page.data() + offset;
    const uint8_t* end = page.data() + file_.usable();
    uint64_t size = 0;
    uint64_t id = 0;
    if (offset == 0 || offset >= file_.usable() || !readVarint(at, end, size) || !readVarint(at, end, id)) {
        return false;
    }
    row.id = static_cast<int64_t>(id);
    return size >= 1 && size <= kLongestRecord && collect(at, end, size) && decode(row);
}

bool RecordReader::collect(const uint8_t* at, const uint8_t* end, uint64_t size) {
    const uint64_t local = localSize(size, file_.usable());
    const auto room = static_cast<uint64_t>(end - at);
    if (local + (local < size ? 4 : 0) > room) {
        return false;
    }
    payload_.assign(at, at + local);
    return local == size || collectOverflow(Big32(at + local), size);
}

// The bytes are taken as their pages come, so that a wrong size costs no more memory than the file has. A page of zeros
// was wiped: texts hold none.
bool RecordReader::collectOverflow(uint32_t next, uint64_t size) {
    while (payload_.size() < size) {
        if (next == 0 || next > file_.count() || used_[next] || !file_.read(next, overflow_) ||
            std::all_of(overflow_.begin(), overflow_.end(), [](uint8_t byte) { return byte == 0; })) {
            return false;
        }
        used_[next] = true;
        const auto part = std::min<uint64_t>(size - payload_.size(), file_.usable() - 4);
        payload_.insert(payload_.end(), overflow_.begin() + 4, overflow_.begin() + 4 + static_cast<ptrdiff_t>(part));
        next = Big32(overflow_.data());
    }
    return next == 0;
}

// The header's types must account for every byte of the record.
bool RecordReader::decode(Row& row) const {
    const uint8_t* at = payload_.data();
    const uint8_t* end = at + payload_.size();
    uint64_t header = 0;
    if (!readVarint(at, end, header) || header > payload_.size() || header < 1) {
        return false;
    }
    const uint8_t* headerEnd = payload_.data() + header;
    const uint8_t* body = headerEnd;
    row.values.clear();
    while (at < headerEnd) {
        uint64_t type = 0;
        uint64_t size = 0;
        if (!readVarint(at, headerEnd, type) || !bodySize(type, size) || size > static_cast<uint64_t>(end - body) ||
            row.values.size() == kMostColumns) {
            return false;
        }
        row.values.push_back(toValue(type, body, static_cast<size_t>(size)));
        body += size;
    }
    return body == end && !row.values.empty();
}

bool IsFullLeaf(const uint8_t* page, size_t size) {
    const uint32_t cells = Big16(page + 3);
    if (page[0] != 0x0d || cells == 0 || kLeafHeader + size_t{2} * cells > size) {
        return false;
    }
    size_t furthest = 0;
    for (uint32_t i = 0; i < cells; ++i) {
        const uint8_t* at = page + Big16(page + kLeafHeader + size_t{2} * i);
        uint64_t payload = 0;
        uint64_t id = 0;
        if (at < page + kLeafHeader || at >= page + size || !readVarint(at, page + size, payload) ||
            !readVarint(at, page + size, id) || payload > kLongestRecord) {
            return false;
        }
        const uint64_t local = localSize(payload, static_cast<uint32_t>(size));
        furthest =
            std::max(furthest, static_cast<size_t>(at - page) + static_cast<size_t>(local) + (local < payload ? 4 : 0));
    }
    return furthest == size;
}

}  // namespace quor::salvage
