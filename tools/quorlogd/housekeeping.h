// Looks after the space that logs take.
#ifndef QUORLOGD_HOUSEKEEPING_H
#define QUORLOGD_HOUSEKEEPING_H

#include "tools/quorlogd/options.h"

namespace quor {

// To be called before the accounting starts: completes databases that lack tables.
void PrepareDatabases();

class Housekeeping {
  public:
    explicit Housekeeping(const Options& options) : options_(options) {}

    // Raises a notice and an event when the volume fills up, once until it has been below the threshold again, has
    // an oversized working database replaced, keeps the event log small, and completes databases that lack tables.
    void check();

  private:
    void checkVolume();
    static void trimEvents();

    const Options& options_;
    bool full_ = false;
};

}  // namespace quor

#endif
