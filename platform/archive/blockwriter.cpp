#include "platform/archive/blockwriter.h"

#include <algorithm>

namespace quor::archive {
namespace {

constexpr size_t kMostBytes = size_t{2} << 20U;  // of the values of a block
constexpr size_t kShortText = 16;                // columns of shorter ones are not searched for words

ColumnHead sameColumn(size_t number) {
    ColumnHead head;
    head.encoding = Encoding::Same;
    head.same = number;
    return head;
}

}  // namespace

bool BlockWriter::full(size_t bytes) const {
    return ids_.size() == kMostRows || (!ids_.empty() && bytes_ + bytes > kMostBytes);
}

void BlockWriter::beginRow(int64_t id) {
    ids_.push_back(id);
}

void BlockWriter::addCell(size_t column, const Cell& cell) {
    bytes_ += cell.bytes.size();
    columns_[column].add(cell);
}

// The column with the most text, if it has any to speak of.
size_t BlockWriter::bloomColumn() const {
    size_t most = kShortText * ids_.size();
    size_t found = SIZE_MAX;
    for (size_t i = 0; i < columns_.size(); ++i) {
        if (columns_[i].onlyTexts() && columns_[i].bytes() > most) {
            most = columns_[i].bytes();
            found = i;
        }
    }
    return found;
}

std::string BlockWriter::bloomOf(size_t column) {
    trigrams_.clear();
    for (size_t row = 0; row < ids_.size(); ++row) {
        trigrams_.add(columns_[column].at(row).bytes);
    }
    return trigrams_.bloom();
}

std::vector<ColumnHead> BlockWriter::encodeColumns(std::string& data) {
    std::vector<ColumnHead> heads;
    for (size_t i = 0; i < columns_.size(); ++i) {
        size_t same = 0;
        while (same < i && !columns_[i].sameAs(columns_[same])) {
            ++same;
        }
        heads.push_back(same < i ? sameColumn(same) : columns_[i].encode(data, compressor_));
    }
    return heads;
}

BlockBytes BlockWriter::finish() {
    BlockBytes block;
    BlockHead head;
    head.rows = ids_.size();
    head.first = ids_.front();
    head.last = ids_.back();
    if (!head.gapless()) {
        for (const int64_t id : ids_) {
            idColumn_.add(IntegerCell(id));
        }
        head.ids = idColumn_.encode(block.data, compressor_);
    }
    head.columns = encodeColumns(block.data);
    head.bloomColumn = bloomColumn();
    if (head.hasBloom()) {
        block.bloom = bloomOf(head.bloomColumn);
        head.bloomSize = block.bloom.size();
        head.bloomChecksum = Checksum(block.bloom);
    }
    block.head = BytesOf(head);
    return block;
}

void BlockWriter::clear() {
    ids_.clear();
    idColumn_.clear();
    for (ColumnWriter& column : columns_) {
        column.clear();
    }
    bytes_ = 0;
}

}  // namespace quor::archive
