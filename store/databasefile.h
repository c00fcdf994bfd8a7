// The file that a database is kept in.
#ifndef STORE_DATABASEFILE_H
#define STORE_DATABASEFILE_H

#include <cstdint>
#include <string>

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

// Bytes of a file; 0 when there is none.
uint64_t SizeOf(const std::string& path);

}  // namespace quor::store

#endif
