#include "platform/notify/channels.h"

#include <algorithm>
#include <cstring>
#include <optional>

#include "base/numbers.h"
#include "base/words.h"
#include "platform/notify/delivery.h"

namespace quor::notify {
namespace {

constexpr const char kFailure[] = "Failed to send notice.";

using Targets = std::vector<std::string>;

// One that needs no name.
Targets oneIf(bool configured) {
    return Targets(configured ? 1 : 0);
}

Targets desktops(const Settings& settings) {
    return oneIf(settings.desktopEnabled);
}

Targets webhooks(const Settings& settings) {
    return settings.webhooks;
}

Targets commands(const Settings& settings) {
    return oneIf(!settings.command.empty());
}

Targets mailServers(const Settings& settings) {
    return oneIf(settings.mailEnabled && settings.mail.server[0] != '\0' && settings.mail.recipient[0] != '\0');
}

constexpr std::array<Channel, kChannelCount> kChannels{{
    {"desktop", desktops, DeliverToDesktop, kFailure},
    {"webhook", webhooks, DeliverToWebhook, kFailure},
    {"command", commands, DeliverToCommand, kFailure},
    {"mail", mailServers, DeliverByMail, "Failed to send email."},
}};

}  // namespace

const std::array<Channel, kChannelCount>& Channels() {
    return kChannels;
}

uint32_t ChannelsNamed(std::string_view names) {
    uint32_t bits = 0;
    EachWord(names, ", \t", [&bits](std::string_view name) {
        for (size_t i = 0; i < kChannelCount; ++i) {
            bits |= name == kChannels[i].name ? 1U << i : 0;
        }
    });
    return bits;
}

Outcome Deliver(const Channel& channel, const Notice& notice) {
    const std::optional<Settings> settings = LoadSettings();
    const Targets targets = settings ? channel.targets(*settings) : Targets();
    const bool wanted = std::find(targets.begin(), targets.end(), notice.target) != targets.end();
    return wanted ? channel.deliver(*settings, notice) : Outcome();
}

// Failed mails are left out: callers look for those themselves.
bool ReportsOwnFailure(const char* content) {
    return strstr(OrEmpty(content), kFailure) != nullptr;
}

}  // namespace quor::notify
