// The ways in which a notice can leave, and what they have in common.
#ifndef PLATFORM_NOTIFY_CHANNELS_H
#define PLATFORM_NOTIFY_CHANNELS_H

#include <array>
#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

#include "platform/notify/notice.h"
#include "platform/notify/settings.h"

namespace quor::notify {

struct Channel {
    const char* name;
    bool (*configured)(const Settings& settings);
    // The cause of the failure; empty when it was delivered.
    std::string (*deliver)(const Settings& settings, const Notice& notice);
    const char* failure;  // what the system log says, followed by the cause
};

constexpr size_t kChannelCount = 3;
const std::array<Channel, kChannelCount>& Channels();

// A bit for each channel that is set up.
uint32_t ConfiguredChannels(const Settings& settings);
// The bits of a comma list of names; unknown names are ignored.
uint32_t ChannelsNamed(std::string_view names);
// Delivers on the notice's channels that are (still) configured; failures go to the system log.
void Deliver(const Notice& notice);
// Log content that holds one of our own failures must not set off another notice, which would fail again.
bool ReportsOwnFailure(const char* content);

}  // namespace quor::notify

#endif
