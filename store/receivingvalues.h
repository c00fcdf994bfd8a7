// Where messages are received, as the values of syslog-ng's configuration have it.
#ifndef STORE_RECEIVINGVALUES_H
#define STORE_RECEIVINGVALUES_H

#include <cstdint>
#include <string>
#include <vector>

#include "base/paths.h"

namespace quor::store {

// What holds where a site says nothing is the same as in the shipped configuration.
struct ReceivingValues {
    uint16_t port = 514;  // UDP, and TCP by lines
    uint16_t framedPort = 601;
    bool tls = false;
    uint16_t tlsPort = 6514;
    uint64_t connections = 1000;  // that each TCP port takes

    std::vector<uint16_t> tcpPorts() const;
};

// Those of the files receiving*.conf of a folder, of which the last definition holds.
ReceivingValues ReadReceivingValues(const std::string& folder = paths::kReceiverValues);

}  // namespace quor::store

#endif
