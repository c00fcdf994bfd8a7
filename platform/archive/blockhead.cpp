#include "platform/archive/blockhead.h"

namespace quor::archive {
namespace {

constexpr uint64_t kLargestBloom = uint64_t{32} << 20U;

}  // namespace

std::string BytesOf(const BlockHead& head) {
    std::string bytes;
    PutNumber(bytes, head.rows);
    PutSigned(bytes, head.first);
    PutSigned(bytes, head.last);
    PutColumnHead(bytes, head.ids);
    for (const ColumnHead& column : head.columns) {
        PutColumnHead(bytes, column);
    }
    PutNumber(bytes, head.hasBloom() ? head.bloomColumn + 1 : 0);
    PutNumber(bytes, head.bloomSize);
    PutFixed(bytes, head.bloomChecksum);
    std::string all;
    PutFixed(all, Checksum(bytes));
    return all + bytes;
}

BlockHead ReadBlockHead(std::string_view bytes, size_t columns) {
    Bytes left(bytes);
    Demand(left.fixed() == Checksum(left.left()), "its head has another checksum");
    BlockHead head;
    head.rows = left.numberUpTo(kMostRows);
    head.first = left.signedNumber();
    head.last = left.signedNumber();
    Demand(head.rows > 0 && head.first <= head.last &&
               static_cast<uint64_t>(head.last) - static_cast<uint64_t>(head.first) >= head.rows - 1,
           "it has no such rows");
    uint64_t offset = 0;
    head.ids = TakeColumnHead(left, 0, head.rows, offset);
    for (size_t i = 0; i < columns; ++i) {
        head.columns.push_back(TakeColumnHead(left, i, head.rows, offset));
    }
    const uint64_t bloomColumn = left.numberUpTo(columns);
    head.bloomColumn = bloomColumn != 0 ? static_cast<size_t>(bloomColumn - 1) : SIZE_MAX;
    head.bloomSize = left.numberUpTo(kLargestBloom);
    head.bloomChecksum = left.fixed();
    Demand(left.left().empty(), "its head is too long");
    return head;
}

}  // namespace quor::archive
