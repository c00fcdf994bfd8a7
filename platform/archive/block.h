// A block that is read: its head at once, a column when it is asked for.
#ifndef PLATFORM_ARCHIVE_BLOCK_H
#define PLATFORM_ARCHIVE_BLOCK_H

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "platform/archive/blockhead.h"
#include "platform/archive/column.h"
#include "platform/archive/storage.h"

namespace quor::archive {

// Reads parts of the big values; one for many blocks.
class PartReader {
  public:
    explicit PartReader(const Storage& storage) : storage_(storage) {}

    // Throws Damaged when the value is not so long.
    std::string data(int64_t key, uint64_t offset, uint64_t size);
    std::string bloom(int64_t key, uint64_t size);
    std::string expand(std::string_view compressed, uint64_t size) {
        return decompressor_.expand(compressed, static_cast<size_t>(size));
    }
    const Storage& storage() const { return storage_; }

  private:
    using Blob = Guard<sqlite3_blob, sqlite3_blob_close>;
    std::string read(Blob& blob, const char* table, const char* column, int64_t key, uint64_t offset, uint64_t size);

    const Storage& storage_;
    Blob data_;
    Blob bloom_;
    Decompressor decompressor_;
};

class Block {
  public:
    // Throws Damaged.
    Block(PartReader& parts, int64_t key, std::string head, size_t columns);
    Block(const Block&) = delete;
    Block& operator=(const Block&) = delete;

    int64_t key() const { return key_; }
    const BlockHead& head() const { return head_; }
    size_t rows() const { return static_cast<size_t>(head_.rows); }
    // What follows throws Damaged, too, when the bytes in question are.
    int64_t id(size_t row);
    Column& column(size_t number);
    // The head of the column that has the values of this one.
    const ColumnHead& columnHead(size_t number) const;
    std::string bloom() const;

  private:
    size_t origin(size_t number) const;
    std::unique_ptr<Column> load(const ColumnHead& head) const;
    void loadIds();

    PartReader& parts_;
    int64_t key_;
    std::string bytes_;  // of the head
    BlockHead head_;
    std::unique_ptr<Column> ids_;
    std::vector<std::unique_ptr<Column>> columns_;
};

}  // namespace quor::archive

#endif
