// How many rows there are of each host, level, hour, and so on.
#ifndef STORE_GROUPS_H
#define STORE_GROUPS_H

#include <array>
#include <cstdint>
#include <string>
#include <vector>

#include "store/selection.h"

namespace quor::store {

constexpr std::array<const char*, 7> kGroupings = {"host", "program", "level", "facility", "hour", "day", "message"};

struct Group {
    std::string name;
    uint64_t rows = 0;
};

// The matching rows of a selection, without limit and offset, by one of kGroupings. Messages that differ only in their
// numbers are one group, a number written as "#". Days and hours come in their order, levels the worst first, all else
// the largest first.
std::vector<Group> CountBy(const Source& source, const Selection& selection, const std::string& grouping);

}  // namespace quor::store

#endif
