// The file that a database is kept in.
#ifndef STORE_DATABASEFILE_H
#define STORE_DATABASEFILE_H

#include <cstdint>
#include <string>

#include "base/guards.h"

namespace quor::store {

// The path made absolute, as the library wants it.
std::string AbsolutePath(const std::string& path);

// The absolute path of a database that exists; Failure otherwise, with `advice` on how to get one.
std::string RequireDatabase(const std::string& path, const std::string& advice);
// The same for a log database.
std::string RequireLogDatabase(const std::string& path);

// Removes the write-ahead log of a database that is about to be removed, and what goes with it: a database that takes
// its place must not find them.
void RemoveCompanions(const std::string& path);

// The absolute path of a database that may be replaced, or of none. Failure for a link, or what is no file.
std::string RequireReplaceable(const std::string& path);

// Bytes of the pages that hold nothing.
uint64_t FreeBytes(const std::string& db);

// Failure, with `advice`, when the folder's disk has no `bytes` left for `what`.
void RequireRoom(const std::string& folder, uint64_t bytes, const std::string& what, const std::string& advice);

// Bytes of a database with what is still in its write-ahead log.
uint64_t WholeSizeOf(const std::string& path);

// Held while a database of the folder is replaced or gets rows from another one: two of that at a time would undo each
// other. Failure when somebody else holds it.
class FolderLock {
  public:
    explicit FolderLock(const std::string& file);

  private:
    Descriptor folder_;
};

// Bytes of a file; 0 when there is none.
uint64_t SizeOf(const std::string& path);

}  // namespace quor::store

#endif
