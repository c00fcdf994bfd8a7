#include "platform/notify/channels.h"

#include <syslog.h>

#include <cstring>
#include <optional>

#include "base/numbers.h"
#include "base/words.h"
#include "platform/notify/delivery.h"
#include "platform/notify/oneline.h"

namespace quor::notify {
namespace {

constexpr const char kFailure[] = "Failed to send notice.";

bool desktopConfigured(const Settings& settings) {
    return settings.desktopEnabled;
}

bool webhookConfigured(const Settings& settings) {
    return !settings.webhookUrls.empty();
}

bool mailConfigured(const Settings& settings) {
    return settings.mailEnabled && settings.mail.server[0] != '\0' && settings.mail.recipient[0] != '\0';
}

// The quick ones first: a slow mail server holds up nothing but mail.
constexpr std::array<Channel, kChannelCount> kChannels{{
    {"desktop", desktopConfigured, DeliverToDesktop, kFailure},
    {"webhook", webhookConfigured, DeliverToWebhooks, kFailure},
    {"mail", mailConfigured, DeliverByMail, "Failed to send email."},
}};

constexpr uint32_t bitOf(size_t channel) {
    return 1U << channel;
}

}  // namespace

const std::array<Channel, kChannelCount>& Channels() {
    return kChannels;
}

uint32_t ConfiguredChannels(const Settings& settings) {
    uint32_t bits = 0;
    for (size_t i = 0; i < kChannelCount; ++i) {
        bits |= kChannels[i].configured(settings) ? bitOf(i) : 0;
    }
    return bits;
}

uint32_t ChannelsNamed(std::string_view names) {
    uint32_t bits = 0;
    EachWord(names, ", \t", [&bits](std::string_view name) {
        for (size_t i = 0; i < kChannelCount; ++i) {
            bits |= name == kChannels[i].name ? bitOf(i) : 0;
        }
    });
    return bits;
}

void Deliver(const Notice& notice) {
    const std::optional<Settings> settings = LoadSettings();
    const uint32_t channels = settings ? notice.channels & ConfiguredChannels(*settings) : 0;
    for (size_t i = 0; i < kChannelCount; ++i) {
        if ((channels & bitOf(i)) == 0) {
            continue;
        }
        const std::string cause = kChannels[i].deliver(*settings, notice);
        if (!cause.empty()) {
            syslog(LOG_ERR, "%s %s: %s", kChannels[i].failure, kChannels[i].name, OneLine(cause, 400).c_str());
        }
    }
}

// Failed mails are left out: callers look for those themselves.
bool ReportsOwnFailure(const char* content) {
    return strstr(OrEmpty(content), kFailure) != nullptr;
}

}  // namespace quor::notify
