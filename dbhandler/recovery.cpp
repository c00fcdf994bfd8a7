#include <syslog.h>

#include <cstdio>

#include "common/logplaces.h"
#include "dbhandler.h"
#include "notification.h"
#include "notification/notice.h"
#include "quor/quorservice.h"

int DBErrorHandle_SQLITE_CORRUPT(DBConnect_tag* /*connection*/, std::string dbPath) {
    NotificationManager notifier;
    quor::StringTable values(QLIBCSzHashAlloc(quor::kNoticeTableSize));
    if (values == nullptr) {
        return -1;
    }
    quor::FillNotice(values, {{"%DBPATH%", dbPath.c_str()}});
    char tag[] = "QUORSYSLOG_DB_CORRUPT";
    (void)notifier.NotificationSend(tag, quor::Adopt(values));  // whether it was sent or not, the file is moved

    if (rename(dbPath.c_str(), (dbPath + ".corrupt").c_str()) != 0) {
        return -1;
    }
    if (QLIBServiceReload("syslog-ng") < 0) {
        syslog(LOG_ERR, "%s:%d Fail to send HUP signal to syslog-ng", "dbhandler", quor::place::kReloadFailed);
        return -1;
    }
    return 0;
}
