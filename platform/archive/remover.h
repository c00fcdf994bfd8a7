// Deleting rows: the blocks that they are in are written anew without them.
#ifndef PLATFORM_ARCHIVE_REMOVER_H
#define PLATFORM_ARCHIVE_REMOVER_H

#include <memory>
#include <string>
#include <vector>

#include "platform/archive/block.h"
#include "platform/archive/storage.h"

namespace quor::archive {

// Gathers the rows of one block; a row of another one has that block written first.
class Remover {
  public:
    Remover(Storage& storage, std::vector<std::string> columns) : storage_(storage), columns_(std::move(columns)) {}

    void remove(int64_t id);
    // Writes what has gathered.
    void flush();
    // Drops it.
    void forget();

  private:
    struct Doomed {
        explicit Doomed(const Storage& storage) : parts(storage) {}
        PartReader parts;
        std::unique_ptr<Block> block;
        std::vector<int64_t> ids;
    };

    bool open(int64_t id);
    std::vector<bool> doomedRows() const;
    void subtract(const std::vector<bool>& doomed);
    void uncount(const std::vector<bool>& doomed);
    void rewrite(const std::vector<bool>& doomed);

    Storage& storage_;
    std::vector<std::string> columns_;
    std::unique_ptr<Doomed> doomed_;
};

}  // namespace quor::archive

#endif
