// Which rows of a log database quorlogd has counted.
#ifndef STORE_COUNTED_H
#define STORE_COUNTED_H

#include <cstdint>
#include <optional>

#include "store/source.h"

namespace quor::store {

// The id up to which the rows are counted, as the accounting database has it; nothing when it does not know them.
std::optional<uint64_t> CountedUpTo(const Source& source);

// The id of the newest row that was received, 0 when there is none: what was put there behind it is never counted.
uint64_t NewestReceived(const Source& source);

}  // namespace quor::store

#endif
