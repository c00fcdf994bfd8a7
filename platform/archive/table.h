// The table of an archive as SQLite sees it: a virtual table over blocks.
#ifndef PLATFORM_ARCHIVE_TABLE_H
#define PLATFORM_ARCHIVE_TABLE_H

#include <sqlite3.h>

#include <string>

#include "platform/archive/question.h"
#include "platform/archive/remover.h"
#include "platform/archive/storage.h"

namespace quor::archive {

// What a damaged block does to a statement that needs it.
enum class Damage { Fails, IsLeftOut };

// What is found below the name of its module: see table.cpp for what SQLite calls.
struct Table : sqlite3_vtab {
    Table(sqlite3* db, const std::string& schema, Shape columns, Damage found);

    Listing listing(size_t column) const;

    Storage storage;
    Shape shape;
    Remover remover;
    Keepsake keepsake;
    Damage damage;
};

// One walk over the rows that a question asks for.
class Cursor : public sqlite3_vtab_cursor {
  public:
    explicit Cursor(Table& table);

    void ask(Question question);
    void askForValues(size_t column, int number);
    bool ended() const { return ended_; }
    void next();
    int64_t id();
    void column(sqlite3_context* context, size_t number);

  private:
    struct Used {
        const Column* column = nullptr;
        Lasting lasting = Lasting::Now;
    };

    void nextBlock();
    bool enter(int64_t key, const std::string& head);
    void use(size_t number);
    void nextValue();

    Table& table_;
    PartReader parts_;
    Question question_;
    Statement heads_;
    std::unique_ptr<Block> block_;
    std::vector<Used> used_;
    std::vector<uint32_t> rows_;  // of the block, in the order in which they come
    size_t at_ = 0;
    bool ended_ = true;
    Statement values_;
    uint64_t repeats_ = 0;  // of the value
    bool once_ = false;
};

// Makes archives readable on a connection; a status of SQLite's.
int Register(sqlite3* db, Damage damage = Damage::Fails);
// Whether the file behind a fresh connection is one.
bool IsArchive(sqlite3* db);

constexpr const char kModule[] = "quorarchive";
constexpr int32_t kApplicationId = 0x51415243;  // "QARC" in the header of the file
constexpr int kVersion = 1;

}  // namespace quor::archive

#endif
