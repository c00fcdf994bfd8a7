// One process at a time.
#ifndef QUORLOGD_PIDFILE_H
#define QUORLOGD_PIDFILE_H

#include <string>

#include "base/guards.h"

namespace quor {

// Holds a lock on the file, in which the number of this process is written, until it is destroyed.
class PidFile {
  public:
    // Throws std::runtime_error when another process holds it, or when it cannot be written.
    explicit PidFile(const std::string& path);

  private:
    Descriptor file_;
};

}  // namespace quor

#endif
