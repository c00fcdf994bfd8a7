// Reading rows through the library: a page in one call, everything in pieces, new rows as they arrive.
#ifndef QUORLOG_SELECTION_H
#define QUORLOG_SELECTION_H

#include <cstdint>
#include <functional>
#include <string>

#include "dbutil.h"
#include "filters.h"

namespace quor::cli {

struct Selection {
    std::string db;
    std::string table;
    Filter filter;
    uint64_t limit = 0;  // 0: every row
    uint64_t offset = 0;
    bool oldestFirst = false;
};

using RecordHandler = std::function<void(const _SYSLOG_LOG_DATA_tag&)>;

// Hands over the rows in the order of their ids. A table of any size takes little memory: rows are read in pieces, and
// rows that arrive meanwhile are not among them. Returns the number of rows.
uint64_t Select(const Selection& selection, const RecordHandler& handler);

// Rows with a larger id than `after`, oldest first; limit, offset and order of the selection do not count.
uint64_t SelectAfter(const Selection& selection, uint64_t after, const RecordHandler& handler);

// The number of matching rows, without limit and offset.
uint64_t Count(const Selection& selection);
// The largest id, which is the number of rows as long as none was deleted; found without reading the table.
uint64_t EstimateCount(const Selection& selection);

bool AnyRow(const std::string& db, const std::string& table, const Conditions& conditions);

// The reason why the database cannot answer, as a QueryFailure.
[[noreturn]] void FailQuery(const std::string& db, const std::string& table, Conditions conditions);

}  // namespace quor::cli

#endif
