#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include "base/paths.h"
#include "dbhandler.h"
#include "dbhandler/shell.h"
#include "quor/quorservice.h"

int SyslogngHupSignalSend() {
    if (QLIBCFileExist(quor::paths::kPackageEnabled) != 0) {
        if (QLIBServicectlJobReload("pkg-Orvane-syslog") >= 0) {
            return 0;
        }
        syslog(LOG_ERR, "Fail to send HUP signal to pkg-Orvane-syslog");
        return -1;
    }
    if (QLIBServiceReload("syslog-ng") >= 0) {
        return 0;
    }
    syslog(LOG_ERR, "Fail to send HUP signal to syslog-ng");
    return -1;
}

int SyslogngWorkingDbCheck(std::string dbPath, int maxSizeKB) {
    struct stat status {};
    if (stat(dbPath.c_str(), &status) != 0) {
        return -1;
    }
    if (!S_ISREG(status.st_mode)) {
        syslog(LOG_ERR, "Working database is not regular file");
        return -1;
    }
    const int64_t sizeKB = static_cast<int64_t>(status.st_size) / 1024;
    if (sizeKB <= maxSizeKB) {
        return 0;
    }
    (void)unlink(dbPath.c_str());   // syslog-ng is told even when another process was faster
    (void)SyslogngHupSignalSend();  // it reports its own failures
    return 0;
}

int SyslogngWorkingDbSetJouWal(std::string dbPath) {
    if (!quor::RunShell(quor::WalCommand(dbPath))) {
        syslog(LOG_ERR, "Fail to set jounal mode as WAL, use DELETE by default");
        return -1;
    }
    return 0;
}
