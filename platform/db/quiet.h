// A database that nobody has open, and whose folder we may not write: SQLite cannot make the files beside it that
// reading takes, and need not.
#ifndef PLATFORM_DB_QUIET_H
#define PLATFORM_DB_QUIET_H

#include <string>

#include "base/guards.h"

namespace quor {

// As long as it is held, the file stays as it is: whoever opens the database keeps what he writes beside it. None when
// the file can be read the usual way.
Descriptor HoldQuiet(const std::string& path);

// The name under which SQLite reads such a file.
std::string QuietName(const std::string& path);

}  // namespace quor

#endif
