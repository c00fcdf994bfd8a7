// Rows in the order of their ids: a page in one question, everything in pieces, counts.
#ifndef STORE_SELECTION_H
#define STORE_SELECTION_H

#include <cstdint>
#include <string>

#include "store/source.h"

namespace quor::store {

struct Selection {
    std::string table = "logs";
    Filter filter;
    uint64_t limit = 0;  // 0: every row
    uint64_t offset = 0;
    bool oldestFirst = false;
};

// Hands over the rows in the order of their ids. A table of any size takes little memory: rows are read in pieces, and
// rows that arrive meanwhile are not among them. Returns the number of rows.
uint64_t Select(const Source& source, const Selection& selection, const RecordHandler& handler);

// The most rows that one question hands over.
constexpr uint64_t kPiece = 8192;

// One piece of the rows with a larger id than `after`, oldest first; limit, offset and order of the selection do not
// count. `after` becomes the id of the last row looked at. Returns the number of rows looked at: fewer than kPiece when
// there are no more.
uint64_t SelectAfter(const Source& source, const Selection& selection, uint64_t& after, const RecordHandler& handler);

// The number of matching rows, without limit and offset.
uint64_t Count(const Source& source, const Selection& selection);

// The largest id of a table, 0 when it is empty; found without reading the table.
uint64_t LargestId(const Source& source, const std::string& table);

bool AnyRow(const Source& source, const std::string& table, const Conditions& conditions);

}  // namespace quor::store

#endif
