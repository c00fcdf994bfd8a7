#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstring>

#include "common/numbers.h"
#include "common/paths.h"
#include "platform/guarded.h"
#include "platform/notify/notify.h"

namespace quor::notify {
namespace {

enum Security { kNone, kStartTls, kTls, kSecurities };
constexpr std::array<const char*, kSecurities> kSecurityNames{"none", "starttls", "tls"};
constexpr std::array<int, kSecurities> kDefaultPorts{25, 587, 465};
constexpr int32_t kDefaultTimeout = 30;
constexpr int32_t kLongestTimeout = 300;

// A key that is absent leaves `out` as it is.
template <size_t Size>
void read(const char* key, char (&out)[Size]) {
    char value[Size]{};
    if (QLIBCFileGetKeyValue(paths::kSystemSettings, key, value, static_cast<int>(Size), 0) >= 0) {
        memcpy(out, value, Size);
    }
}

std::string readText(const char* key) {
    char value[2048]{};
    read(key, value);
    return value;
}

bool readYes(const char* key, bool absent) {
    const std::string value = readText(key);
    return value.empty() ? absent : value == "yes";
}

bool readable() {
    return access(paths::kSystemSettings, R_OK) == 0;
}

// An unknown word must not send a password in the clear.
int securityNamed(const std::string& name) {
    const auto* const found = std::find(kSecurityNames.begin(), kSecurityNames.end(), name);
    return found == kSecurityNames.end() ? kStartTls : static_cast<int>(found - kSecurityNames.begin());
}

QUORMAIL readMail() {
    QUORMAIL mail{};
    read("smtp_server", mail.server);
    read("smtp_recipient", mail.recipient);
    read("smtp_sender", mail.sender);
    read("smtp_user", mail.user);
    read("smtp_password", mail.password);
    read("smtp_ca_file", mail.caFile);
    mail.verify = readYes("smtp_tls_verify", true) ? 1 : 0;
    mail.security = securityNamed(readText("smtp_security"));
    const int32_t port = ToInt32(readText("smtp_port").c_str());
    mail.port = port > 0 && port <= 65535 ? port : kDefaultPorts[static_cast<size_t>(mail.security)];
    return mail;
}

Settings readSettings() {
    Settings settings;
    settings.mail = readMail();
    settings.mailEnabled = readYes("smtp_mail_enabled", false);
    settings.desktopEnabled = readYes("desktop_notify_enabled", false);
    settings.webhookUrls = Words(readText("webhook_url"), " \t");
    settings.webhookCaFile = readText("webhook_ca_file");
    settings.webhookVerify = readYes("webhook_tls_verify", true);
    const int32_t timeout = ToInt32(readText("notify_timeout").c_str());
    settings.timeout = timeout > 0 ? std::min(timeout, kLongestTimeout) : kDefaultTimeout;
    return settings;
}

}  // namespace

std::optional<Settings> LoadSettings() {
    return readable() ? std::optional(readSettings()) : std::nullopt;
}

}  // namespace quor::notify

int QUORMailGet(QUORMAIL* mail) {
    using namespace quor;
    if (mail == nullptr || !notify::readable()) {
        return -1;
    }
    return Guarded(-1, [&] {
        *mail = notify::readMail();
        return 0;
    });
}

QUORSMSCONF* QUORSmsConfGet() {
    using namespace quor;
    if (!notify::readable()) {
        return nullptr;
    }
    return Guarded(static_cast<QUORSMSCONF*>(nullptr),
                   [] { return new QUORSMSCONF{notify::readYes("sms_enabled", false) ? 1 : 0}; });
}

void QUORSmsConfFree(QUORSMSCONF* conf) {
    delete conf;
}
