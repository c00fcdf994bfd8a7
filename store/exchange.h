// A database takes the place of the one that syslog-ng writes and quorlogd follows.
#ifndef STORE_EXCHANGE_H
#define STORE_EXCHANGE_H

#include <cstdint>
#include <string>

namespace quor::store {

enum class Fill {
    Nothing,  // the new database is complete
    Newer,    // it gets the rows that came since it was copied; Failure when others have changed
};

struct Exchanged {
    std::string aside;      // where the former database is now; empty when there was none
    bool damaged = false;   // it could not be read
    bool complete = false;  // nobody writes it any more, and what it still got is in the new one as well
};

// Puts `draft`, a file in the same folder that nobody uses, in the place of `db`, which is kept beside it under a name
// with `label` and the time, with all its rows. Whatever syslog-ng receives is in one of both; what it still wrote to
// the former database after the exchange is received by the new one. quorlogd has counted the former one, or nothing is
// done; the rows of the draft that it has not counted are new to it, and no others. An identity that it does not know
// is taken for counted when `foreignCounted`.
Exchanged Exchange(const std::string& draft, const std::string& db, const std::string& label, Fill fill,
                   bool foreignCounted);

}  // namespace quor::store

#endif
