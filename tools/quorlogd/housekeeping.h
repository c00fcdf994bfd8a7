// Looks after the space that logs take.
#ifndef QUORLOGD_HOUSEKEEPING_H
#define QUORLOGD_HOUSEKEEPING_H

#include "tools/quorlogd/options.h"

namespace quor {

// To be called before the accounting starts. Completes databases that a full volume left without their tables. Counts
// that cannot be read at the start begin again from zero, so a locked database is waited for.
void PrepareDatabases();

class Housekeeping {
  public:
    explicit Housekeeping(const Options& options) : options_(options) {}

    // Raises a notice and an event when the volume fills up, once until it has been below the threshold again, has
    // an oversized working database replaced, and completes databases that a full volume left without their tables.
    void check();

  private:
    void checkVolume();

    const Options& options_;
    bool full_ = false;
};

}  // namespace quor

#endif
