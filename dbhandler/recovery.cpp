#include <syslog.h>

#include <cstdio>

#include "common/handles.h"
#include "common/logplaces.h"
#include "dbhandler.h"
#include "notification.h"
#include "quor/quorservice.h"

int DBErrorHandle_SQLITE_CORRUPT(DBConnect_tag* /*connection*/, std::string dbPath) {
    NotificationManager notifier;
    quor::StringTable values(QLIBCSzHashAlloc(1024));
    if (values == nullptr) {
        return -1;
    }
    // Neither a value that cannot be set nor a notice that cannot be sent keeps the file from being moved.
    char tag[] = "QUORSYSLOG_DB_CORRUPT";
    (void)QLIBCSzHashSetValue(quor::Adopt(values), "%DBPATH%", dbPath.c_str());
    (void)notifier.NotificationSend(tag, quor::Adopt(values));

    if (rename(dbPath.c_str(), (dbPath + ".corrupt").c_str()) != 0) {
        return -1;
    }
    if (QLIBServiceReload("syslog-ng") < 0) {
        syslog(LOG_ERR, "%s:%d Fail to send HUP signal to syslog-ng", "dbhandler", quor::place::kReloadFailed);
        return -1;
    }
    return 0;
}
