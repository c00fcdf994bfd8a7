#include "platform/archive/columnwriter.h"

#include <xxhash.h>

#include <algorithm>

namespace quor::archive {
namespace {

constexpr size_t kFew = 512;  // and one in eight rows more
constexpr size_t kTableSize = 8192;
constexpr size_t kDictionaryInHead = 2048;  // bytes

size_t hashOf(const Cell& cell) {
    const XXH64_hash_t bytes = XXH3_64bits(cell.bytes.data(), cell.bytes.size());
    return static_cast<size_t>(bytes ^ (cell.number * 0x9E3779B97F4A7C15U) ^ static_cast<uint64_t>(cell.kind));
}

}  // namespace

ColumnWriter::Slot ColumnWriter::store(const Cell& cell) {
    const bool numeric = cell.kind == Cell::Kind::Integer || cell.kind == Cell::Kind::Real;
    const Slot slot{cell.kind, static_cast<uint32_t>(cell.bytes.size()), numeric ? cell.number : bytes_.size()};
    bytes_ += cell.bytes;
    return slot;
}

Cell ColumnWriter::cellOf(const Slot& slot) const {
    const bool numeric = slot.kind == Cell::Kind::Integer || slot.kind == Cell::Kind::Real;
    if (numeric) {
        return {slot.kind, slot.number, {}};
    }
    return {slot.kind, 0, std::string_view(bytes_).substr(static_cast<size_t>(slot.number), slot.size)};
}

Cell ColumnWriter::at(size_t row) const {
    return cellOf(few_ ? values_[codes_[row]] : slots_[row]);
}

void ColumnWriter::add(const Cell& cell) {
    onlyTexts_ = onlyTexts_ && (cell.isText() || cell.kind == Cell::Kind::Null);
    if (few_ && !addToFew(cell)) {
        becomeMany();
    }
    if (!few_) {
        slots_.push_back(store(cell));
    }
}

// False when it would be one too many.
bool ColumnWriter::addToFew(const Cell& cell) {
    if (!codes_.empty() && cellOf(values_[codes_.back()]) == cell) {
        codes_.push_back(codes_.back());
        ++counts_[codes_.back()];
        return true;
    }
    if (table_.empty()) {
        table_.resize(kTableSize);
    }
    size_t place = hashOf(cell) % kTableSize;
    while (table_[place] != 0 && !(cellOf(values_[table_[place] - 1U]) == cell)) {
        place = (place + 1) % kTableSize;
    }
    if (table_[place] == 0) {
        if (values_.size() >= std::min(kFew + codes_.size() / 8, kTableSize / 2)) {
            return false;
        }
        values_.push_back(store(cell));
        counts_.push_back(0);
        table_[place] = static_cast<uint16_t>(values_.size());
    }
    codes_.push_back(static_cast<uint16_t>(table_[place] - 1U));
    ++counts_[codes_.back()];
    return true;
}

void ColumnWriter::becomeMany() {
    few_ = false;
    for (const uint16_t code : codes_) {
        slots_.push_back(values_[code]);
    }
}

bool ColumnWriter::sameAs(const ColumnWriter& other) const {
    if (few_ != other.few_ || bytes_ != other.bytes_) {
        return false;
    }
    return few_ ? codes_ == other.codes_ && values_ == other.values_ : slots_ == other.slots_;
}

Entries ColumnWriter::entries() const {
    Entries entries;
    for (size_t i = 0; few_ && i < values_.size(); ++i) {
        entries.push_back({cellOf(values_[i]), counts_[i]});
    }
    return entries;
}

std::string ColumnWriter::rawFew(ColumnHead& head) const {
    std::string raw;
    std::string dictionary;
    Entries all = entries();
    head.encoding = Encoding::Dictionary;
    head.entries = all.size();
    head.range = RangeOf(all);
    PutEntries(dictionary, all);
    head.dictionary = dictionary.size() <= kDictionaryInHead;
    if (head.dictionary) {
        head.values = std::move(all);
    } else {
        raw = dictionary;
    }
    for (const uint16_t code : codes_) {
        PutByte(raw, static_cast<uint8_t>(code));
        if (head.entries > 256) {
            PutByte(raw, static_cast<uint8_t>(code >> 8U));
        }
    }
    return raw;
}

Encoding ColumnWriter::encodingOfMany() const {
    const auto all = [this](Cell::Kind kind) {
        return std::all_of(slots_.begin(), slots_.end(), [kind](const Slot& slot) { return slot.kind == kind; });
    };
    if (all(Cell::Kind::Integer)) {
        return Encoding::Integers;
    }
    return all(Cell::Kind::Text) && bytes_.find('\0') == std::string::npos ? Encoding::Texts : Encoding::Cells;
}

std::string ColumnWriter::rawMany(ColumnHead& head) const {
    std::string raw;
    raw.reserve(bytes_.size() + slots_.size() * 2);
    head.encoding = encodingOfMany();
    uint64_t before = 0;
    for (const Slot& slot : slots_) {
        const Cell cell = cellOf(slot);
        Widen(head.range, cell, &slot == slots_.data());
        if (head.encoding == Encoding::Integers) {
            PutSigned(raw, static_cast<int64_t>(cell.number - before));
            before = cell.number;
        } else if (head.encoding == Encoding::Texts) {
            raw.append(cell.bytes).push_back('\0');
        } else {
            PutCell(raw, cell);
        }
    }
    Shorten(head.range);
    return raw;
}

ColumnHead ColumnWriter::encode(std::string& data, Compressor& compressor) const {
    ColumnHead head;
    if (few_ && values_.size() == 1) {
        head.constant = cellOf(values_.front());
        return head;
    }
    const std::string raw = few_ ? rawFew(head) : rawMany(head);
    const size_t before = data.size();
    head.expanded = raw.size();
    head.size = compressor.append(data, raw);
    head.checksum = Checksum(std::string_view(data).substr(before));
    return head;
}

void ColumnWriter::clear() {
    few_ = onlyTexts_ = true;
    bytes_.clear();
    values_.clear();
    counts_.clear();
    codes_.clear();
    slots_.clear();
    std::fill(table_.begin(), table_.end(), uint16_t{0});
}

}  // namespace quor::archive
