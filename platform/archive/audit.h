// Looking at every row of an archive, or of a plain table to compare it with.
#ifndef PLATFORM_ARCHIVE_AUDIT_H
#define PLATFORM_ARCHIVE_AUDIT_H

#include <functional>
#include <string>

#include "platform/archive/definition.h"
#include "platform/archive/storage.h"
#include "quor/quorarchive.h"

namespace quor::archive {

// Told the rows done so far; may throw to give up.
using Progress = std::function<void(uint64_t rows)>;

// Fills in the rows, blocks and damage of the report, and its checksum.
void AuditArchive(const Storage& storage, const Definition& columns, const Progress& progress, QUORARCHIVE& report);

struct Tally {
    uint64_t rows = 0;
    uint64_t sum = 0;
};
Tally TallyTable(sqlite3* db, const std::string& schema, const Definition& columns, const Progress& progress);

// A number of logs_archive; 0 when it is not there.
uint64_t Remembered(const Storage& storage, const std::string& name);
void Remember(const Storage& storage, const std::string& name, uint64_t number);

}  // namespace quor::archive

#endif
