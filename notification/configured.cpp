// Whether any channel is configured over which a notice could reach somebody.
#include <array>
#include <cstring>

#include "base/guards.h"
#include "base/paths.h"
#include "notification.h"
#include "notification/report.h"
#include "quor/quornotify.h"

namespace {

// Whether a setting of the system is "yes". False, with the message, when it cannot be read.
bool readSwitch(const char* key, int place, const char* message, bool& on) {
    std::array<char, 16> value{};
    if (QLIBCFileGetKeyValue(quor::paths::kSystemSettings, key, value.data(), static_cast<int>(value.size()), 0) < 0) {
        quor::Report(place, message);
        return false;
    }
    on = strcmp(value.data(), "yes") == 0;
    return true;
}

bool readMail(bool& set) {
    QUORMAIL mail{};
    if (QUORMailGet(&mail) < 0) {
        quor::Report(quor::place::kMailSettings, "Fail to get mail setting");
        return false;
    }
    bool enabled = false;
    if (!readSwitch("smtp_mail_enabled", quor::place::kMailSwitch, "Fail to get smtp mail setting", enabled)) {
        return false;
    }
    set = enabled && mail.server[0] != '\0' && mail.recipient[0] != '\0';
    return true;
}

bool readSms(bool& set) {
    const quor::Guard<QUORSMSCONF, QUORSmsConfFree> conf(QUORSmsConfGet());
    if (conf == nullptr) {
        quor::Report(quor::place::kSmsSettings, "Fail to get sms setting");
        return false;
    }
    set = conf->enabled != 0;
    return true;
}

bool readPush(bool& set) {
    bool mobile = false;
    bool msn = false;
    bool skype = false;
    const bool complete =
        readSwitch("pushservice_mobile_enabled", quor::place::kMobileSwitch, "Fail to get mobile setting", mobile) &&
        readSwitch("pushservice_msn_enabled", quor::place::kMsnSwitch, "Fail to get msn setting", msn) &&
        readSwitch("pushservice_skype_enabled", quor::place::kSkypeSwitch, "Fail to get skype setting", skype);
    set = mobile || msn || skype;
    return complete;
}

}  // namespace

bool IsNotificationSet() {
    bool mail = false;
    bool sms = false;
    bool push = false;
    const bool complete = readMail(mail) && readSms(sms) && readPush(push);
    return mail || (complete && (sms || push));
}
