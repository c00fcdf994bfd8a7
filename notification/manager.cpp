#include <algorithm>
#include <array>

#include "notification.h"
#include "notification/notice.h"

namespace {

constexpr char kFailedMail[] = "Failed to send email.";

// 0, or -1 with a second report beside that of NotificationSend().
int send(NotificationManager& manager, const char* tag, quor::StringTable& table) {
    if (manager.NotificationSend(const_cast<char*>(tag), quor::Adopt(table)) < 0) {
        Debuger::MSG(0, "Fail to send notification");
        return -1;
    }
    return 0;
}

quor::StringTable newTable() {
    quor::StringTable table(QLIBCSzHashAlloc(quor::kNoticeTableSize));
    if (table == nullptr) {
        Debuger::MSG(0, "Fail to allocation memory");
    }
    return table;
}

int sendValue(NotificationManager& manager, const char* tag, const quor::NoticeValue& value) {
    quor::StringTable table = newTable();
    if (table == nullptr) {
        return -1;
    }
    quor::FillNotice(table, {value});
    return send(manager, tag, table);
}

int sendContent(NotificationManager& manager, const char* tag, const std::string& host, const quor::NoticeValue& match,
                const std::string& content) {
    if (content.find(kFailedMail) != std::string::npos) {
        return 0;  // a notice about it would fail as well, and be logged, and so on
    }
    quor::StringTable table = newTable();
    if (table == nullptr) {
        return -1;
    }
    quor::EscapedContent escaped;
    if (!escaped.escape(content.c_str())) {
        Debuger::MSG(0, "Not enough memory");
        return -1;
    }
    quor::FillNotice(table, {{"%HOST%", host.c_str()}, match, {"%SYSLOG_CONTENT%", escaped.text.data()}});
    return send(manager, tag, table);
}

}  // namespace

NotificationManager::NotificationManager() {
    if (ConfigLoad(quor::paths::kNotifyRules) < 0) {
        Debuger::MSG(0, "Fail to load configuration");
    }
}

NotificationManager::~NotificationManager() = default;

int NotificationManager::ConfigLoad(std::string file) {
    quor::StringList sections(QLIBCSzListAlloc(1024));
    if (sections == nullptr) {
        Debuger::MSG(0, "Fail to allocate memory");
        return -1;
    }
    if (QLIBCFileEnumSection(file.c_str(), quor::Adopt(sections)) < 0) {
        Debuger::MSG(0, "Fail to do QLIBCFileEnumSection");
        return -1;
    }
    const std::array<std::list<_SYSLOG_NOTIFY_RULES_tag>*, 3> lists{&sevRules_, &epsRules_, &kwRules_};
    for (int i = 0; i < sections->count; ++i) {
        const char* const section = sections->items[i];
        _SYSLOG_NOTIFY_RULES_tag rule;
        if (SyslogNotifyConfGet(file, section, rule) < 0) {
            Debuger::MSG(0, std::string("Fail to get notification setting ") + section);
            break;
        }
        if (rule.notify_type >= 0 && static_cast<size_t>(rule.notify_type) < lists.size()) {
            lists[static_cast<size_t>(rule.notify_type)]->push_back(rule);
        }
    }
    return 0;
}

bool NotificationManager::CheckEps(unsigned long long eps) {
    return std::any_of(epsRules_.begin(), epsRules_.end(), [eps](const _SYSLOG_NOTIFY_RULES_tag& rule) {
        return rule.notify_enable && static_cast<uint64_t>(rule.notify_eps) <= eps;
    });
}

bool NotificationManager::CheckSev(_SYSLOG_DB_PRIORITY_tag pri) {
    return std::any_of(sevRules_.begin(), sevRules_.end(), [pri](const _SYSLOG_NOTIFY_RULES_tag& rule) {
        return rule.notify_enable && pri <= rule.notify_pri;
    });
}

std::string NotificationManager::CheckKeyword(std::string content) {
    for (const _SYSLOG_NOTIFY_RULES_tag& rule : kwRules_) {
        if (rule.notify_enable && !rule.notify_pat.empty() && content.find(rule.notify_pat) != std::string::npos) {
            return rule.notify_pat;
        }
    }
    return {};
}

int NotificationManager::NotificationSend(char* tag, QLIBSZHASH** table) {
    if (tag == nullptr || table == nullptr) {
        return -1;
    }
    (void)QLIBCSzHashSetValue(table, "DESKTOP_NOTIFY_CLASSNAME", "QUOR.KVX.Orvane.Instance");
    if (quor::SendNotice(tag, *table) < 0) {
        Debuger::MSG(0, std::string("Fail to send notification: ") + tag);
        return -1;
    }
    return 0;
}

int NotificationManager::NotificationSendEps(unsigned long long eps) {
    const std::string number = ullNumberToString(eps);
    return sendValue(*this, "QUORSYSLOG_EPS_EXCEED", {"%EPS%", number.c_str()});
}

int NotificationManager::NotificationSendSev(std::string host, std::string sev, std::string content) {
    return sendContent(*this, "QUORSYSLOG_SEV_EXCEED", host, {"%SEV%", sev.c_str()}, content);
}

int NotificationManager::NotificationSendSev(std::string host, _SYSLOG_DB_PRIORITY_tag pri, _SYSLOG_LOG_DATA_tag& log) {
    return NotificationSendSev(host, PriorTypeToStr(pri), log.msg);
}

int NotificationManager::NotificationSendKeyword(std::string host, std::string keyword, std::string content) {
    return sendContent(*this, "QUORSYSLOG_KEYWORD_MATCH", host, {"%KEYWORD%", keyword.c_str()}, content);
}

int NotificationManager::NotificationSendKeyword(std::string host, std::string keyword, _SYSLOG_LOG_DATA_tag& log) {
    return NotificationSendKeyword(host, keyword, log.msg);
}

int NotificationManager::NotificationSendVolFull(std::string share) {
    return sendValue(*this, "QUORSYSLOG_VOL_FULL", {"%SHARED_FOLDER%", share.c_str()});
}
