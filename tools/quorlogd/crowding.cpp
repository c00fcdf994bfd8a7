#include "tools/quorlogd/crowding.h"

#include "base/numbers.h"
#include "store/connections.h"
#include "store/receivingvalues.h"
#include "tools/quorlogd/announce.h"

namespace quor {
namespace {

void announce(uint16_t port, const store::PortUse& use, uint64_t most) {
    const std::string number = std::to_string(port);
    RecordEvent("TCP port " + number + " has [" + Decimal(use.connections) + "] of " + Decimal(most) +
                " connections, [" + Decimal(use.busiestHolds) + "] of them from " + use.busiest);
    SendNotice("QUORSYSLOG_CROWDED", {{"%PORT%", number},
                                      {"%COUNT%", Decimal(use.connections)},
                                      {"%LIMIT%", Decimal(most)},
                                      {"%HELD%", Decimal(use.busiestHolds)},
                                      {"%ADDRESS%", use.busiest}});
}

}  // namespace

void Crowding::check() {
    const store::ReceivingValues values = store::ReadReceivingValues();
    std::set<uint16_t> crowded;
    for (const auto& [port, use] : store::UseOfPorts(values.tcpPorts())) {
        const bool known = crowded_.count(port) != 0;
        if (!store::IsCrowded(use, known ? values.connections / 2 : values.connections)) {
            continue;
        }
        crowded.insert(port);
        if (!known) {
            announce(port, use, values.connections);
        }
    }
    crowded_ = std::move(crowded);
}

}  // namespace quor
