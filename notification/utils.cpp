#include <syslog.h>

#include <array>
#include <cstring>

#include "common.h"
#include "common/guards.h"
#include "common/numbers.h"
#include "common/paths.h"
#include "notification.h"
#include "quor/quornotify.h"

namespace {

constexpr int kRuleTableSize = 1024;
constexpr char kEntryFormat[] = "%s=\"%s\"\n";

// The line numbers are part of the messages.
void report(int line, const char* message) {
    syslog(LOG_ERR, "%s:%d %s", "utils", line, message);
}

enum RuleKey { kType, kPriority, kEps, kPattern, kEnable, kRuleKeys };
constexpr std::array<const char*, kRuleKeys> kRuleKeyNames{"notify_type", "notify_pri", "notify_eps", "notify_pat",
                                                           "notify_enable"};

using RuleValues = std::array<const char*, kRuleKeys>;

// False when the section is absent or lacks a key. The values belong to the table.
bool readValues(const std::string& file, const std::string& section, quor::StringTable& table, RuleValues& values) {
    if (QLIBCFileGetSection(file.c_str(), section.c_str(), quor::Adopt(table)) < 0) {
        return false;
    }
    for (size_t key = 0; key < values.size(); ++key) {
        values[key] = QLIBCSzHashGetValue(table.get(), kRuleKeyNames[key]);
        if (values[key] == nullptr) {
            return false;
        }
    }
    return true;
}

// A negative number is written as the unsigned one of the same 64 bits.
std::string decimal(int64_t value) {
    return ullNumberToString(static_cast<uint64_t>(value));
}

bool setValue(quor::StringTable& table, RuleKey key, const std::string& value) {
    return value.find('\0') == std::string::npos &&  // it would be cut there
           QLIBCSzHashSetValue(quor::Adopt(table), kRuleKeyNames[key], value.c_str()) >= 0;
}

bool writeRule(const std::string& file, const _SYSLOG_NOTIFY_RULES_tag& rule, quor::StringTable& table) {
    const char* const section = rule.name.c_str();
    return setValue(table, kType, decimal(rule.notify_type)) && setValue(table, kEps, decimal(rule.notify_eps)) &&
           setValue(table, kPriority, decimal(rule.notify_pri)) && setValue(table, kPattern, rule.notify_pat) &&
           setValue(table, kEnable, rule.notify_enable ? "1" : "0") && strlen(section) == rule.name.size() &&
           QLIBCFileSetSection(file.c_str(), section, section, table.get(), kEntryFormat) >= 0;
}

// Whether a setting of the system is "yes". False, with the message, when it cannot be read.
bool readSwitch(const char* key, int line, const char* message, bool& on) {
    std::array<char, 16> value{};
    if (QLIBCFileGetKeyValue(quor::paths::kSystemSettings, key, value.data(), static_cast<int>(value.size()), 0) < 0) {
        report(line, message);
        return false;
    }
    on = strcmp(value.data(), "yes") == 0;
    return true;
}

bool readMail(bool& set) {
    QUORMAIL mail{};
    if (QUORMailGet(&mail) < 0) {
        report(161, "Fail to get mail setting");
        return false;
    }
    bool enabled = false;
    if (!readSwitch("smtp_mail_enabled", 166, "Fail to get smtp mail setting", enabled)) {
        return false;
    }
    set = enabled && mail.server[0] != '\0' && mail.recipient[0] != '\0';
    return true;
}

bool readSms(bool& set) {
    const std::unique_ptr<QUORSMSCONF, quor::Releaser<QUORSmsConfFree>> conf(QUORSmsConfGet());
    if (conf == nullptr) {
        report(178, "Fail to get sms setting");
        return false;
    }
    set = conf->enabled != 0;
    return true;
}

bool readPush(bool& set) {
    bool mobile = false;
    bool msn = false;
    bool skype = false;
    const bool complete = readSwitch("pushservice_mobile_enabled", 188, "Fail to get mobile setting", mobile) &&
                          readSwitch("pushservice_msn_enabled", 196, "Fail to get msn setting", msn) &&
                          readSwitch("pushservice_skype_enabled", 204, "Fail to get skype setting", skype);
    set = mobile || msn || skype;
    return complete;
}

}  // namespace

int SyslogNotifyConfGet(const std::string& file, const std::string& section, _SYSLOG_NOTIFY_RULES_tag& rule) {
    quor::StringTable table(QLIBCSzHashAlloc(kRuleTableSize));
    if (table == nullptr) {
        report(81, "Fail to allocate memory");
        return -1;
    }
    RuleValues values{};
    if (!readValues(file, section, table, values)) {
        report(85, "Fail to do QLIBCFileGetSection");
        return -1;
    }
    rule.name = section;
    rule.notify_type = quor::ToInt32(values[kType]);
    rule.notify_pri = static_cast<_SYSLOG_DB_PRIORITY_tag>(quor::ToInt32(values[kPriority]));
    rule.notify_eps = quor::ToInt64(values[kEps]);
    rule.notify_pat = values[kPattern];
    rule.notify_enable = strcmp(values[kEnable], "1") == 0;
    return 0;
}

int SyslogNotifyConfSet(const std::string& file, const std::string& /*section*/, _SYSLOG_NOTIFY_RULES_tag& rule) {
    quor::StringTable table(QLIBCSzHashAlloc(kRuleTableSize));
    if (table == nullptr) {
        report(124, "Fail to allocate memory");
        return -1;
    }
    if (!writeRule(file, rule, table)) {
        report(139, "Fail set section to file");
        return -1;
    }
    return 0;
}

bool IsNotificationSet() {
    bool mail = false;
    bool sms = false;
    bool push = false;
    const bool complete = readMail(mail) && readSms(sms) && readPush(push);
    return mail || (complete && (sms || push));
}
