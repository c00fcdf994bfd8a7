// An event database for the length of one call, created from the package's schema when it is missing.
#ifndef LOGGER_EVENTDB_H
#define LOGGER_EVENTDB_H

#include <string>

#include "base/paths.h"
#include "common.h"
#include "dbhandler/session.h"

namespace quor {

struct EventDb : DbSession {
    explicit EventDb(const std::string& path) : DbSession(path, paths::kEventSchema) {}
};

}  // namespace quor

#endif
