// Connections that senders hold to the ports on which logs are received.
#ifndef STORE_CONNECTIONS_H
#define STORE_CONNECTIONS_H

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace quor::store {

struct PortUse {
    uint64_t connections = 0;
    std::string busiest;  // the address that holds most of them
    uint64_t busiestHolds = 0;
};

// Of those of the TCP ports at which a program listens. A sender over IPv4 has its IPv4 address, however it is
// connected.
std::map<uint16_t, PortUse> UseOfPorts(const std::vector<uint16_t>& ports);

// Whether a port that takes `most` connections soon takes no more.
bool IsCrowded(const PortUse& use, uint64_t most);

}  // namespace quor::store

#endif
