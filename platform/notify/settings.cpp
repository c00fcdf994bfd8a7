#include "platform/notify/settings.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <memory>

#include "base/guarded.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "base/textfile.h"
#include "base/words.h"
#include "platform/core/sections.h"

namespace quor::notify {
namespace {

constexpr std::array<const char*, kSecurities> kSecurityNames{"none", "starttls", "tls"};
constexpr std::array<int, kSecurities> kDefaultPorts{25, 587, 465};
constexpr std::pair<const char*, const char*> kWebhookKeys[] = {
    {"webhook_url", ""}, {"webhook_text_url", "text "}, {"webhook_content_url", "content "}};
constexpr int32_t kDefaultTimeout = 30;
constexpr int32_t kLongestTimeout = 300;

// The settings file, read once for all keys.
class Keys {
  public:
    // Nothing when the file cannot be read.
    static std::optional<Keys> load() {
        Keys keys;
        const bool read = ReadTextFile(paths::kSystemSettings, kMostSectionBytes, *keys.text_) == ReadOutcome::Done;
        keys.lines_ = ParseSectionLines(*keys.text_);
        return read ? std::optional(std::move(keys)) : std::nullopt;
    }

    // The first line with the key counts; empty when there is none.
    std::string text(std::string_view key) const {
        for (const SectionLine& line : lines_) {
            if (line.kind == SectionLine::Kind::Entry && line.name == key) {
                return std::string(line.value);
            }
        }
        return "";
    }

    bool yes(std::string_view key, bool absent = false) const {
        const std::string value = text(key);
        return value.empty() ? absent : value == "yes";
    }

    // A text too long for its place is as good as none: half an address leads to somebody else.
    template <size_t Size>
    void copy(std::string_view key, char (&out)[Size]) const {
        const std::string value = text(key);
        if (value.size() < Size) {
            memcpy(out, value.c_str(), value.size() + 1);
        }
    }

  private:
    std::unique_ptr<std::string> text_ = std::make_unique<std::string>();  // the lines point into it
    SectionLines lines_;
};

// An unknown word must not send a password in the clear.
int securityNamed(const std::string& name) {
    const auto* const found = std::find(kSecurityNames.begin(), kSecurityNames.end(), name);
    return found == kSecurityNames.end() ? kStartTls : static_cast<int>(found - kSecurityNames.begin());
}

QUORMAIL readMail(const Keys& keys) {
    QUORMAIL mail{};
    keys.copy("smtp_server", mail.server);
    keys.copy("smtp_recipient", mail.recipient);
    keys.copy("smtp_sender", mail.sender);
    keys.copy("smtp_user", mail.user);
    keys.copy("smtp_password", mail.password);
    keys.copy("smtp_ca_file", mail.caFile);
    mail.verify = keys.yes("smtp_tls_verify", true) ? 1 : 0;
    mail.security = securityNamed(keys.text("smtp_security"));
    const int32_t port = ToInt32(keys.text("smtp_port").c_str());
    mail.port = port > 0 && port <= 65535 ? port : kDefaultPorts[static_cast<size_t>(mail.security)];
    return mail;
}

Settings readSettings(const Keys& keys) {
    Settings settings;
    settings.mail = readMail(keys);
    settings.mailEnabled = keys.yes("smtp_mail_enabled");
    settings.desktopEnabled = keys.yes("desktop_notify_enabled");
    for (const auto& [key, form] : kWebhookKeys) {
        EachWord(keys.text(key), " \t",
                 [&, form = form](std::string_view url) { settings.webhooks.push_back(form + std::string(url)); });
    }
    settings.command = keys.text("notify_command");
    settings.webhookCaFile = keys.text("webhook_ca_file");
    settings.webhookVerify = keys.yes("webhook_tls_verify", true);
    const int32_t timeout = ToInt32(keys.text("notify_timeout").c_str());
    settings.timeout = timeout > 0 ? std::min(timeout, kLongestTimeout) : kDefaultTimeout;
    return settings;
}

}  // namespace

std::optional<Settings> LoadSettings() {
    const std::optional<Keys> keys = Keys::load();
    return keys ? std::optional(readSettings(*keys)) : std::nullopt;
}

}  // namespace quor::notify

int QUORMailGet(QUORMAIL* mail) {
    using quor::notify::Keys;
    return quor::Guarded([&] {
        const std::optional<Keys> keys = mail != nullptr ? Keys::load() : std::nullopt;
        if (!keys) {
            return -1;
        }
        *mail = quor::notify::readMail(*keys);
        return 0;
    });
}

QUORSMSCONF* QUORSmsConfGet() {
    using quor::notify::Keys;
    return quor::Guarded(static_cast<QUORSMSCONF*>(nullptr), [] {
        const std::optional<Keys> keys = Keys::load();
        return keys ? new QUORSMSCONF{keys->yes("sms_enabled") ? 1 : 0} : nullptr;
    });
}

void QUORSmsConfFree(QUORSMSCONF* conf) {
    delete conf;
}
