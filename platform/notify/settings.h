// The settings of the channels.
#ifndef PLATFORM_NOTIFY_SETTINGS_H
#define PLATFORM_NOTIFY_SETTINGS_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "quor/quornotify.h"

namespace quor::notify {

// What QUORMAIL holds as its security.
enum Security { kPlainText, kStartTls, kTls, kSecurities };

struct Settings {
    QUORMAIL mail{};
    bool mailEnabled = false;
    bool desktopEnabled = false;
    std::vector<std::string>
        webhooks;  // addresses; the name of its form and a blank before one that gets less than all
    std::string webhookCaFile;
    bool webhookVerify = true;
    std::string command;  // a path
    int32_t timeout = 0;  // seconds for one delivery
};

// Nothing when the file cannot be read.
std::optional<Settings> LoadSettings();

}  // namespace quor::notify

#endif
