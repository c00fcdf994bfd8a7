#include "platform/archive/columnhead.h"

#include <algorithm>

namespace quor::archive {
namespace {

constexpr uint64_t kLargestExpanded = kLongestValue + (uint64_t{4} << 20U);
constexpr size_t kLongestEnd = 32;

void putText(std::string& out, const std::string& text) {
    PutNumber(out, text.size());
    out += text;
}

std::string takeText(Bytes& bytes) {
    return std::string(bytes.take(bytes.numberUpTo(kLongestEnd)));
}

void putRange(std::string& out, const Range& range) {
    PutByte(out, static_cast<uint8_t>(range.kind));
    if (range.kind == Range::Kind::Integers) {
        PutSigned(out, range.least);
        PutSigned(out, range.most);
    } else if (range.texts()) {
        putText(out, range.leastText);
        putText(out, range.mostText);
    }
}

Range takeRange(Bytes& bytes) {
    Range range;
    const uint8_t kind = bytes.byte();
    Demand(kind <= static_cast<uint8_t>(Range::Kind::TextsFrom), "a range of no known kind");
    range.kind = static_cast<Range::Kind>(kind);
    if (range.kind == Range::Kind::Integers) {
        range.least = bytes.signedNumber();
        range.most = bytes.signedNumber();
    } else if (range.texts()) {
        range.leastText = takeText(bytes);
        range.mostText = takeText(bytes);
    }
    return range;
}

}  // namespace

void PutEntries(std::string& out, const Entries& entries) {
    for (const Entry& entry : entries) {
        PutCell(out, entry.cell);
        PutNumber(out, entry.rows);
    }
}

Entries TakeEntries(Bytes& bytes, size_t count, uint64_t rows) {
    Entries entries;
    for (size_t i = 0; i < count; ++i) {
        const Cell cell = TakeCell(bytes);
        entries.push_back({cell, bytes.numberUpTo(rows)});
    }
    return entries;
}

void PutColumnHead(std::string& out, const ColumnHead& head) {
    PutByte(out, static_cast<uint8_t>(head.encoding));
    if (head.encoding == Encoding::Same) {
        PutNumber(out, head.same);
        return;
    }
    if (head.encoding == Encoding::Constant) {
        PutCell(out, head.constant);
        return;
    }
    PutNumber(out, head.size);
    PutNumber(out, head.expanded);
    PutFixed(out, head.checksum);
    putRange(out, head.range);
    if (head.encoding == Encoding::Dictionary) {
        PutNumber(out, head.entries);
        PutByte(out, head.dictionary ? 1 : 0);
        PutEntries(out, head.values);
    }
}

ColumnHead TakeColumnHead(Bytes& bytes, size_t number, uint64_t rows, uint64_t& offset) {
    ColumnHead head;
    const uint8_t encoding = bytes.byte();
    Demand(encoding <= static_cast<uint8_t>(Encoding::Cells), "a column of no known kind");
    head.encoding = static_cast<Encoding>(encoding);
    if (head.encoding == Encoding::Same) {
        head.same = static_cast<size_t>(bytes.number());
        Demand(head.same < number, "a column that equals a later one");
        return head;
    }
    if (head.encoding == Encoding::Constant) {
        head.constant = TakeCell(bytes);
        return head;
    }
    head.offset = offset;
    head.size = bytes.numberUpTo(kLargestExpanded);
    offset += head.size;
    head.expanded = bytes.numberUpTo(kLargestExpanded);
    head.checksum = bytes.fixed();
    head.range = takeRange(bytes);
    if (head.encoding == Encoding::Dictionary) {
        head.entries = static_cast<size_t>(bytes.numberUpTo(rows));
        head.dictionary = bytes.byte() != 0;
        head.values = TakeEntries(bytes, head.dictionary ? head.entries : 0, rows);
    }
    return head;
}

void Widen(Range& range, const Cell& cell, bool first) {
    if (first) {
        range.kind = cell.isText()                      ? Range::Kind::Texts
                     : cell.kind == Cell::Kind::Integer ? Range::Kind::Integers
                                                        : Range::Kind::Unknown;
    }
    if (range.kind == Range::Kind::Integers && cell.kind == Cell::Kind::Integer) {
        range.least = first ? cell.integer() : std::min(range.least, cell.integer());
        range.most = first ? cell.integer() : std::max(range.most, cell.integer());
    } else if (range.kind == Range::Kind::Texts && cell.isText()) {
        if (first || cell.bytes < range.leastText) {
            range.leastText = cell.bytes;
        }
        if (first || cell.bytes > range.mostText) {
            range.mostText = cell.bytes;
        }
    } else {
        range.kind = Range::Kind::Unknown;
    }
}

// What a text begins with is not larger than the text.
void Shorten(Range& range) {
    range.leastText.resize(std::min(range.leastText.size(), kLongestEnd));
    if (range.mostText.size() > kLongestEnd) {
        range.mostText.clear();
        range.kind = range.texts() ? Range::Kind::TextsFrom : range.kind;
    }
}

Range RangeOf(const Entries& entries) {
    Range range;
    for (const Entry& entry : entries) {
        Widen(range, entry.cell, &entry == entries.data());
    }
    Shorten(range);
    return range;
}

}  // namespace quor::archive
