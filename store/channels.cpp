#include "store/channels.h"

#include <array>
#include <string>

#include "base/paths.h"
#include "notification.h"
#include "quor/quorcore.h"

namespace quor::store {
namespace {

std::string setting(const char* key) {
    std::array<char, 4096> value{};
    return QLIBCFileGetKeyValue(paths::kSystemSettings, key, value.data(), static_cast<int>(value.size()), 0) < 0
               ? ""
               : value.data();
}

}  // namespace

bool IsChannelSet() {
    for (const char* key : {"webhook_url", "webhook_text_url", "webhook_content_url", "notify_command"}) {
        if (setting(key).find_first_not_of(" \t") != std::string::npos) {
            return true;
        }
    }
    return setting("desktop_notify_enabled") == "yes" || IsNotificationSet();
}

}  // namespace quor::store
