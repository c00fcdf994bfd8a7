#include "platform/archive/column.h"

#include <cstring>
#include <utility>

namespace quor::archive {
namespace {

bool keepCell(Keepsake& keepsake, Cell& cell) {
    if (cell.bytes.empty()) {
        cell.bytes = "";
        return true;
    }
    const std::string* kept = keepsake.keep(cell.bytes);
    cell.bytes = kept != nullptr ? *kept : cell.bytes;
    return kept != nullptr;
}

}  // namespace

const std::string* Keepsake::keep(std::string_view text) {
    constexpr size_t kRoom = size_t{1} << 20U;
    constexpr size_t kOverhead = sizeof(std::string);
    std::string own(text);
    const auto found = texts_.find(own);
    if (found != texts_.end()) {
        return &*found;
    }
    if (text.size() + kOverhead > kRoom - bytes_) {
        return nullptr;
    }
    bytes_ += text.size() + kOverhead;
    return &*texts_.insert(std::move(own)).first;
}

Column::Column(const ColumnHead& head, std::string raw, size_t rows) : encoding_(head.encoding), raw_(std::move(raw)) {
    switch (encoding_) {
    case Encoding::Constant:
        cells_.push_back(head.constant);
        break;
    case Encoding::Dictionary:
        readCodes(head, rows);
        break;
    case Encoding::Integers:
        readIntegers(rows);
        break;
    case Encoding::Texts:
        readTexts(rows);
        break;
    case Encoding::Cells:
        readCells(rows);
        break;
    case Encoding::Same:
        throw Damaged("a column of no kind of its own");
    }
}

void Column::readCodes(const ColumnHead& head, size_t rows) {
    Bytes bytes(raw_);
    entries_ = head.dictionary ? head.values : TakeEntries(bytes, head.entries, rows);
    wide_ = entries_.size() > 256;
    codes_ = bytes.left();
    Demand(codes_.size() == rows * (wide_ ? 2 : 1), "more or fewer values than rows");
    for (size_t row = 0; row < rows; ++row) {
        Demand(code(row) < entries_.size(), "a value that is not in the dictionary");
    }
}

void Column::readIntegers(size_t rows) {
    Bytes bytes(raw_);
    integers_.reserve(rows);
    uint64_t value = 0;
    for (size_t row = 0; row < rows; ++row) {
        value += static_cast<uint64_t>(bytes.signedNumber());
        integers_.push_back(static_cast<int64_t>(value));
    }
    Demand(bytes.left().empty(), "more numbers than rows");
}

void Column::readTexts(size_t rows) {
    starts_.reserve(rows + 1);
    const char* const begin = raw_.data();
    const char* at = begin;
    const char* const end = begin + raw_.size();
    for (size_t row = 0; row < rows; ++row) {
        starts_.push_back(static_cast<uint32_t>(at - begin));
        const void* zero = at < end ? memchr(at, 0, static_cast<size_t>(end - at)) : nullptr;
        Demand(zero != nullptr, "fewer texts than rows");
        at = static_cast<const char*>(zero) + 1;
    }
    starts_.push_back(static_cast<uint32_t>(at - begin));
    Demand(at == end, "more texts than rows");
}

void Column::readCells(size_t rows) {
    Bytes bytes(raw_);
    cells_.reserve(rows);
    for (size_t row = 0; row < rows; ++row) {
        cells_.push_back(TakeCell(bytes));
    }
    Demand(bytes.left().empty(), "more values than rows");
}

bool Column::keep(Keepsake& keepsake) {
    bool all = encoding_ <= Encoding::Dictionary;
    for (Entry& entry : entries_) {
        all = all && keepCell(keepsake, entry.cell);
    }
    return all && (encoding_ != Encoding::Constant || keepCell(keepsake, cells_.front()));
}

size_t Column::code(size_t row) const {
    if (!wide_) {
        return static_cast<uint8_t>(codes_[row]);
    }
    return static_cast<uint8_t>(codes_[2 * row]) | static_cast<size_t>(static_cast<uint8_t>(codes_[2 * row + 1])) << 8U;
}

Cell Column::at(size_t row) const {
    switch (encoding_) {
    case Encoding::Constant:
        return cells_.front();
    case Encoding::Dictionary:
        return entries_[code(row)].cell;
    case Encoding::Integers:
        return IntegerCell(integers_[row]);
    case Encoding::Texts:
        return {Cell::Kind::Text, 0, std::string_view(raw_).substr(starts_[row], starts_[row + 1] - starts_[row] - 1)};
    default:
        return cells_[row];
    }
}

}  // namespace quor::archive
