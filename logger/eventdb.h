// What the parts of the event log share.
#ifndef LOGGER_EVENTDB_H
#define LOGGER_EVENTDB_H

#include <string>

#include "common.h"
#include "common/paths.h"
#include "dbhandler/session.h"

namespace quor {

struct EventDb : DbSession {
    explicit EventDb(const std::string& path) : DbSession(path, paths::kEventSchema) {}
};

// The number as the library writes 32-bit values: a negative one becomes the unsigned one of 64 bits.
inline std::string WidenedDecimal(int32_t value) {
    return ullNumberToString(static_cast<uint64_t>(static_cast<int64_t>(value)));
}

}  // namespace quor

#endif
