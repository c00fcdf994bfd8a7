#include "tests/support/notices.h"

int QUORSysNotifySendNotificationCustomized(const char* tag, const char* textsDir, const char* filterFile,
                                            QLIBSZHASH* values, int /*flags*/) {
    quor::test::Notice notice{tag, textsDir, filterFile, {}};
    for (const char* key : {"%HOST%", "%SEV%", "%KEYWORD%", "%EPS%", "%SYSLOG_CONTENT%", "%SHARED_FOLDER%", "%DBPATH%",
                            "DESKTOP_NOTIFY_CLASSNAME"}) {
        if (const char* value = QLIBCSzHashGetValue(values, key)) {
            notice.values[key] = value;
        }
    }
    quor::test::Notices& notices = quor::test::FakeNotices();
    notices.sent.push_back(std::move(notice));
    if (notices.onSend) {
        notices.onSend();
    }
    return notices.fail ? -1 : 0;
}

int QUORMailGet(QUORMAIL* mail) {
    *mail = quor::test::FakeNotices().mail;
    return quor::test::FakeNotices().mailUnreadable ? -1 : 0;
}

QUORSMSCONF* QUORSmsConfGet() {
    quor::test::Notices& notices = quor::test::FakeNotices();
    notices.smsLent += notices.smsUnreadable ? 0 : 1;
    return notices.smsUnreadable ? nullptr : &notices.sms;
}

void QUORSmsConfFree(QUORSMSCONF* conf) {
    quor::test::FakeNotices().smsLent -= conf != nullptr ? 1 : 0;
}
