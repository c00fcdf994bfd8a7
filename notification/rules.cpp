#include <array>
#include <cstring>

#include "base/numbers.h"
#include "common/handles.h"
#include "notification.h"
#include "notification/report.h"

namespace {

constexpr int kRuleTableSize = 1024;
constexpr char kEntryFormat[] = "%s=\"%s\"\n";

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

bool setValue(quor::StringTable& table, RuleKey key, const std::string& value) {
    return value.find('\0') == std::string::npos &&  // it would be cut there
           QLIBCSzHashSetValue(quor::Adopt(table), kRuleKeyNames[key], value.c_str()) >= 0;
}

bool writeRule(const std::string& file, const _SYSLOG_NOTIFY_RULES_tag& rule, quor::StringTable& table) {
    const char* const section = rule.name.c_str();
    return setValue(table, kType, quor::WrappedDecimal(rule.notify_type)) &&
           setValue(table, kEps, quor::WrappedDecimal(rule.notify_eps)) &&
           setValue(table, kPriority, quor::WrappedDecimal(rule.notify_pri)) &&
           setValue(table, kPattern, rule.notify_pat) && setValue(table, kEnable, rule.notify_enable ? "1" : "0") &&
           strlen(section) == rule.name.size() &&
           QLIBCFileSetSection(file.c_str(), section, section, table.get(), kEntryFormat) >= 0;
}

}  // namespace

int SyslogNotifyConfGet(const std::string& file, const std::string& section, _SYSLOG_NOTIFY_RULES_tag& rule) {
    quor::StringTable table(QLIBCSzHashAlloc(kRuleTableSize));
    if (table == nullptr) {
        quor::Report(quor::place::kReadRuleMemory, "Fail to allocate memory");
        return -1;
    }
    RuleValues values{};
    if (!readValues(file, section, table, values)) {
        quor::Report(quor::place::kReadRule, "Fail to do QLIBCFileGetSection");
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
        quor::Report(quor::place::kWriteRuleMemory, "Fail to allocate memory");
        return -1;
    }
    if (!writeRule(file, rule, table)) {
        quor::Report(quor::place::kWriteRule, "Fail set section to file");
        return -1;
    }
    return 0;
}
