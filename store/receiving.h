// What becomes of messages before they are stored: syslog-ng's own counts, and the datagrams that the kernel drops.
#ifndef STORE_RECEIVING_H
#define STORE_RECEIVING_H

#include <cstdint>
#include <map>
#include <optional>
#include <string>

namespace quor::store {

// What syslog-ng says of the log database.
struct ReceiverCounts {
    int process = 0;       // its number
    bool stores = false;   // it has the log database as a destination
    uint64_t dropped = 0;  // since its start
    uint64_t queued = 0;
    uint64_t written = 0;  // since its start
};

// Asks on its control socket; nothing, with the cause in errno, when it does not answer within seconds.
std::optional<ReceiverCounts> AskReceiver(const std::string& control);

// Datagrams dropped at a port since its socket was opened, by the number of the socket.
std::map<uint64_t, uint64_t> UdpDrops(unsigned port);

// The number of the quorlogd that runs, 0 when none does: it holds a lock on the file with its number.
int FollowerProcess();

}  // namespace quor::store

#endif
