#include "platform/archive/block.h"

#include <utility>

namespace quor::archive {
namespace {

void requireReadable(sqlite3* db, int status) {
    Demand((status & 0xff) != SQLITE_CORRUPT, "the pages of the file that hold it are damaged");
    Require(db, status);
}

}  // namespace

// A handle that was open is taken to the next row, which is quicker than to open another one; when that fails, the row
// may have been written anew.
std::string PartReader::read(Blob& blob, const char* table, const char* column, int64_t key, uint64_t offset,
                             uint64_t size) {
    sqlite3* const db = storage_.db();
    if (blob == nullptr || sqlite3_blob_reopen(blob.get(), key) != SQLITE_OK) {
        blob.reset();
        const int status = sqlite3_blob_open(db, storage_.schema().c_str(), table, column, key, 0, Adopt(blob));
        Demand(status != SQLITE_ERROR, "a part of it is missing");
        requireReadable(db, status);
    }
    const auto all = static_cast<uint64_t>(sqlite3_blob_bytes(blob.get()));
    Demand(offset <= all && size <= all - offset, "a part of it is missing");
    std::string bytes(static_cast<size_t>(size), '\0');
    requireReadable(db, sqlite3_blob_read(blob.get(), bytes.data(), static_cast<int>(size), static_cast<int>(offset)));
    return bytes;
}

std::string PartReader::data(int64_t key, uint64_t offset, uint64_t size) {
    return read(data_, "logs_data", "data", key, offset, size);
}

std::string PartReader::bloom(int64_t key, uint64_t size) {
    return read(bloom_, "logs_blooms", "bloom", key, 0, size);
}

Block::Block(PartReader& parts, int64_t key, std::string head, size_t columns)
    : parts_(parts), key_(key), bytes_(std::move(head)), head_(ReadBlockHead(bytes_, columns)), columns_(columns) {
    Demand(key <= head_.first, "it holds rows of another block");
}

size_t Block::origin(size_t number) const {
    while (head_.columns[number].encoding == Encoding::Same) {
        number = head_.columns[number].same;
    }
    return number;
}

const ColumnHead& Block::columnHead(size_t number) const {
    return head_.columns[origin(number)];
}

std::unique_ptr<Column> Block::load(const ColumnHead& head) const {
    if (!head.hasBytes()) {
        return std::make_unique<Column>(head, std::string(), rows());
    }
    const std::string compressed = parts_.data(key_, head.offset, head.size);
    Demand(Checksum(compressed) == head.checksum, "a column has another checksum");
    return std::make_unique<Column>(head, parts_.expand(compressed, head.expanded), rows());
}

Column& Block::column(size_t number) {
    std::unique_ptr<Column>& column = columns_[origin(number)];
    if (column == nullptr) {
        column = load(columnHead(number));
    }
    return *column;
}

// They must grow, or a walk would not end where it should.
void Block::loadIds() {
    auto ids = load(head_.ids);
    for (size_t row = 0; row < rows(); ++row) {
        const Cell id = ids->at(row);
        Demand(id.kind == Cell::Kind::Integer, "row numbers that are none");
        Demand(row == 0 ? id.integer() == head_.first : ids->at(row - 1).integer() < id.integer(),
               "row numbers out of order");
    }
    Demand(ids->at(rows() - 1).integer() == head_.last, "row numbers out of order");
    ids_ = std::move(ids);
}

int64_t Block::id(size_t row) {
    if (head_.gapless()) {
        return head_.first + static_cast<int64_t>(row);
    }
    if (row + 1 == rows()) {
        return head_.last;
    }
    if (ids_ == nullptr) {
        loadIds();
    }
    return ids_->at(row).integer();
}

std::string Block::bloom() const {
    std::string bloom = parts_.bloom(key_, head_.bloomSize);
    Demand(Checksum(bloom) == head_.bloomChecksum, "its filter of words has another checksum");
    return bloom;
}

}  // namespace quor::archive
