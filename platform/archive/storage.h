// The tables behind an archived table: one row for each block in three of them.
#ifndef PLATFORM_ARCHIVE_STORAGE_H
#define PLATFORM_ARCHIVE_STORAGE_H

#include <sqlite3.h>

#include <cstdint>
#include <optional>
#include <string>

#include "platform/archive/blockwriter.h"
#include "platform/db/statement.h"

namespace quor::archive {

// What SQLite refused.
class Refused : public std::runtime_error {
  public:
    Refused(sqlite3* db, int status) : std::runtime_error(sqlite3_errmsg(db)), status_(status) {}
    int status() const { return status_; }

  private:
    int status_;
};

// Throws Refused, or std::bad_alloc where memory is missing.
void Require(sqlite3* db, int status);
Statement Prepared(sqlite3* db, const std::string& sql);
// Whether there is another row.
bool NextRow(sqlite3* db, const Statement& statement);
// A statement without rows.
void Run(sqlite3* db, const std::string& sql);

std::string QuotedName(const std::string& name);
std::string_view BlobOf(const Statement& statement, int column);
std::string TextOf(const Statement& statement, int column);

// What cannot be answered in this form.
class Unanswered : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

// The tables in one schema of a connection ("main" or the name of an attached database). A block is known by its key,
// the smallest row number that it may hold.
class Storage {
  public:
    Storage(sqlite3* db, const std::string& schema) : db_(db), prefix_(QuotedName(schema) + "."), schema_(schema) {}

    sqlite3* db() const { return db_; }
    const std::string& schema() const { return schema_; }
    std::string table(const std::string& name) const { return prefix_ + name; }

    void create() const;
    void add(const BlockBytes& block, int64_t key);
    void replace(const BlockBytes& block, int64_t key);
    void remove(int64_t key);
    // The key of the block that a row number belongs to.
    std::optional<int64_t> keyFor(int64_t id) const;
    std::string head(int64_t key) const;

  private:
    void write(const char* how, const BlockBytes& block, int64_t key);
    void put(Statement& statement, const std::string& sql, int64_t key, const std::string& bytes);

    sqlite3* db_;
    std::string prefix_;
    std::string schema_;
    Statement addHead_, addData_, addBloom_;
};

}  // namespace quor::archive

#endif
