// Rows as they arrive.
#ifndef STORE_FOLLOWER_H
#define STORE_FOLLOWER_H

#include <cstdint>

#include "store/selection.h"

namespace quor::store {

// Stands after the newest row of the moment when it was made, and goes on from there.
class Follower {
  public:
    // Limit, offset and order of the selection do not count. `source` must outlive this.
    Follower(const Source& source, Selection selection);

    // Hands over the last `rows` (0: all) that were there at the beginning, oldest first.
    void last(uint64_t rows, const RecordHandler& handler) const;
    // Hands over what has arrived since the last look, oldest first. Rows that took the place of those before (the
    // database was removed and begun anew) are all new; while a new one has no table yet, nothing has arrived.
    void poll(const RecordHandler& handler);

  private:
    const Source& source_;
    Selection selection_;
    uint64_t identity_;
    uint64_t after_;
};

}  // namespace quor::store

#endif
