// Looks after the space that logs take.
#ifndef QUORLOGD_HOUSEKEEPING_H
#define QUORLOGD_HOUSEKEEPING_H

#include "quorlogd/options.h"

namespace quor {

class Housekeeping {
  public:
    explicit Housekeeping(const Options& options) : options_(options) {}

    // Raises a notice and an event when the volume fills up, once until it has been below the threshold again, and has
    // an oversized working database replaced.
    void check();

  private:
    void checkVolume();

    const Options& options_;
    bool full_ = false;
};

}  // namespace quor

#endif
