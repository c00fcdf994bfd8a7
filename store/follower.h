// Rows as they arrive.
#ifndef STORE_FOLLOWER_H
#define STORE_FOLLOWER_H

#include <cstdint>
#include <functional>
#include <string>
#include <vector>

#include "store/selection.h"

namespace quor::store {

// Goes on from a position in the rows, through whatever takes their place.
class Follower {
  public:
    // Where to begin in a collection of rows that was not followed before, by its identity: the id after which rows are
    // new. It may throw, and is asked again with the next look.
    using Start = std::function<uint64_t(const std::string& identity)>;

    // Stands after the newest row of this moment. Limit, offset and order of the selection do not count. `source` must
    // outlive this.
    Follower(const Source& source, Selection selection);
    // Stands where `start` says.
    Follower(const Source& source, Selection selection, Start start);

    // Hands over the last `rows` (0: all) up to where it stands, oldest first.
    void last(uint64_t rows, const RecordHandler& handler) const;
    // Hands over what has arrived since the last look, oldest first: one piece of it. Rows that were put there from
    // another database have not arrived. Rows that
    // took the place of those before (the database was removed and begun anew) are followed from their start; while a
    // new database has no table yet, or others lock it, nothing has arrived. False when there is no more for now.
    bool poll(const RecordHandler& handler);

    // The rows that it stands in, and the last one that it has looked at.
    const std::string& identity() const { return identity_; }
    uint64_t position() const { return after_; }

  private:
    bool enter(const std::string& identity);
    uint64_t look(const RecordHandler& handler);
    std::vector<IdRange> broughtInto(const std::string& table) const;

    const Source& source_;
    Selection selection_;
    Start start_;
    std::string identity_;
    uint64_t after_ = 0;
};

}  // namespace quor::store

#endif
