#include <syslog.h>

#include "notification.h"
#include "notification/notice.h"

namespace {

int sendShareNotice(const char* tag, const char* share) {
    if (share == nullptr) {
        return -1;
    }
    quor::StringTable table(QLIBCSzHashAlloc(quor::kNoticeTableSize));
    if (table == nullptr) {
        return -1;
    }
    quor::FillNotice(table, {{"%SHARED_FOLDER%", share}});
    return SyslogMailSend(tag, quor::Adopt(table));
}

int sendLogNotice(const char* tag, const quor::NoticeValue& match, const char* content) {
    if (match.value == nullptr || content == nullptr) {
        return -1;
    }
    quor::EscapedContent escaped;
    quor::StringTable table(QLIBCSzHashAlloc(quor::kNoticeTableSize));
    if (table == nullptr || !escaped.escape(content)) {
        return -1;
    }
    quor::FillNotice(table, {match, {"%SYSLOG_CONTENT%", escaped.text.data()}});
    return SyslogMailSend(tag, quor::Adopt(table));
}

}  // namespace

int SyslogMailSend(const char* tag, QLIBSZHASH** table) {
    if (tag == nullptr || table == nullptr) {
        return -1;
    }
    if (quor::SendNotice(tag, *table) < 0) {
        syslog(LOG_ERR, "Fail to send notification: %s", tag);
        return -1;
    }
    return 0;
}

int SyslogMailShareRemove(const char* share) {
    return sendShareNotice("QUORSYSLOG_ShareRemove", share);
}

int SyslogMailShareRename(const char* share) {
    return sendShareNotice("QUORSYSLOG_ShareRename", share);
}

int SyslogMailShareEncMount(const char* share) {
    return sendShareNotice("QUORSYSLOG_ShareEncMount", share);
}

int SyslogMailShareEncUnmount(const char* share) {
    return sendShareNotice("QUORSYSLOG_ShareEncUnmount", share);
}

int SyslogMailSeverityExceeded(const char* sev, const char* content) {
    return sendLogNotice("QUORSYSLOG_SEV_EXCEED", {"%SEV%", sev}, content);
}

int SyslogMailKeywordMatched(const char* keyword, const char* content) {
    return sendLogNotice("QUORSYSLOG_KEYWORD_MATCH", {"%KEYWORD%", keyword}, content);
}
