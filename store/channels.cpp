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
    return setting("desktop_notify_enabled") == "yes" ||
           setting("webhook_url").find_first_not_of(" \t") != std::string::npos || IsNotificationSet();
}

}  // namespace quor::store
