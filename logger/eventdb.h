// The event database for the length of one call.
#ifndef LOGGER_EVENTDB_H
#define LOGGER_EVENTDB_H

#include <string>

#include "common.h"
#include "common/paths.h"
#include "dbhandler.h"

namespace quor {

class EventDb {
  public:
    explicit EventDb(const std::string& path) : handler_(path, paths::kEventSchema) {}
    EventDb(const EventDb&) = delete;
    EventDb& operator=(const EventDb&) = delete;
    ~EventDb() { handler_.DBDiscon(); }

    // Creates a missing database. Reports a failure.
    bool connect() {
        if (handler_.DBCon() < 0) {
            Debuger::MSG(0, "Fail to connect db");
            return false;
        }
        return true;
    }

    DBHandler* operator->() { return &handler_; }

  private:
    DBHandler handler_;
};

// The number as the library writes 32-bit values: a negative one becomes the unsigned one of 64 bits.
inline std::string WidenedDecimal(int32_t value) {
    return ullNumberToString(static_cast<uint64_t>(static_cast<int64_t>(value)));
}

}  // namespace quor

#endif
