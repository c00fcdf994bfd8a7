// TCP ports that are about to take no more connections: whoever holds them, idle or not, keeps other senders out.
#ifndef QUORLOGD_CROWDING_H
#define QUORLOGD_CROWDING_H

#include <cstdint>
#include <set>

namespace quor {

class Crowding {
  public:
    // Records and announces a port that has become crowded, and who holds most of its connections; once, until half
    // of it is free again.
    void check();

  private:
    std::set<uint16_t> crowded_;
};

}  // namespace quor

#endif
