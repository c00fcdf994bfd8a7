// The ways in which a notice can leave, and what they have in common.
#ifndef PLATFORM_NOTIFY_CHANNELS_H
#define PLATFORM_NOTIFY_CHANNELS_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

#include "platform/notify/delivery.h"
#include "platform/notify/notice.h"
#include "platform/notify/settings.h"

namespace quor::notify {

struct Channel {
    const char* name;
    // The places that get a notice of their own, since each may fail by itself; none when the channel is not set up.
    std::vector<std::string> (*targets)(const Settings& settings);
    // To the notice's target.
    Outcome (*deliver)(const Settings& settings, const Notice& notice);
    const char* failure;  // what the system log says, followed by the cause
};

constexpr size_t kChannelCount = 4;
const std::array<Channel, kChannelCount>& Channels();

// A bit for each entry of Channels() in a comma list of names; unknown names are ignored.
uint32_t ChannelsNamed(std::string_view names);
// The same result as the channel's own `deliver`, without a failure when the target is not set up any more.
Outcome Deliver(const Channel& channel, const Notice& notice);
// Log content that holds one of our own failures must not set off another notice, which would fail again.
bool ReportsOwnFailure(const char* content);

}  // namespace quor::notify

#endif
