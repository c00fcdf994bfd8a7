// Rows as they arrive.
#ifndef STORE_FOLLOWER_H
#define STORE_FOLLOWER_H

#include <cstdint>

#include "store/selection.h"

namespace quor::store {

// Begins after the row that is the newest when it is made, and goes on from there.
class Follower {
  public:
    // Limit, offset and order of the selection are ignored. `source` must outlive this.
    Follower(const Source& source, Selection selection);

    // Hands over the last `rows` (0: all) of those that were there at the beginning, oldest first.
    void last(uint64_t rows, const RecordHandler& handler) const;
    // Hands over what has arrived since the last look, oldest first. When the database was replaced, every row of the
    // new one has arrived. While there is no database, or one without the table, nothing has.
    void poll(const RecordHandler& handler);

  private:
    void deliver(uint64_t newest, const RecordHandler& handler);

    const Source& source_;
    Selection selection_;
    uint64_t identity_;
    uint64_t after_;
};

}  // namespace quor::store

#endif
