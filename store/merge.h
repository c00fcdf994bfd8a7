// Rows of one log database put into another one, also beside a program that writes it.
#ifndef STORE_MERGE_H
#define STORE_MERGE_H

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

namespace quor::store {

struct Merged {
    uint64_t added = 0;
    uint64_t there = 0;  // rows that were in both
};

using MergeProgress = std::function<void(uint64_t part, uint64_t parts)>;

// Adds the rows of table logs that `into` lacks, a row being all that is stored of a message but its id: of rows that
// are equal, as many as the one of both that has more of them. They get new ids in the order of their dates and are
// noted as brought. Writes are short, with as long a pause after each; what was added stays when the rest fails, and a
// second call goes on. `from` is not trusted.
Merged MergeRows(const std::string& from, const std::string& into, const MergeProgress& progress);

// Adds the rows behind the id `after` with new ids at once, as if they were received. Returns their number.
uint64_t AppendRows(const std::string& from, uint64_t after, const std::string& into);

// The columns of table logs that are stored, with their types.
struct StoredColumn {
    std::string name;  // quoted
    std::string type;
};
std::vector<StoredColumn> StoredColumns(const std::string& db);

// Failure unless `db` is sound and its logs are a plain table.
void RequireSoundLogs(const std::string& db);

// Failure unless its logs take two equal messages. `db` is a copy that nobody reads; it is left as it was.
void RequireWritableLogs(const std::string& db);

}  // namespace quor::store

#endif
