#include "tools/quorlogd/housekeeping.h"

#include <sys/statvfs.h>
#include <syslog.h>

#include "base/paths.h"
#include "dbhandler/session.h"
#include "logger.h"
#include "notification.h"
#include "quor/quorcore.h"

namespace quor {
namespace {

// As df shows it: of what is not set aside for root. Negative when the volume cannot be asked.
double usedPercent(const std::string& folder) {
    struct statvfs volume {};
    if (statvfs(folder.c_str(), &volume) != 0) {
        return -1;
    }
    const auto used = static_cast<double>(volume.f_blocks - volume.f_bfree);
    const double usable = used + static_cast<double>(volume.f_bavail);
    return usable > 0 ? 100 * used / usable : 0;
}

// A database that was created on a full volume has no tables, and is not created again because it is there.
void complete(const char* path, const char* schema, const char* table) {
    DbSession db(path, schema);
    if (QLIBCFileExist(path) != 0 && db.connect() && db->DBcheckTableExist(table) == 0) {
        (void)db->DBCreate();  // reports its own failure, and leaves tables that are there alone
    }
}

void completeAll() {
    complete(paths::kEventDb, paths::kEventSchema, "log");
    complete(paths::kAccountingDb, paths::kAccountingSchema, "histogram");
}

}  // namespace

void PrepareDatabases() {
    completeAll();
    constexpr int kTries = 3;  // each waits for a lock
    for (int i = 0; i < kTries && QLIBCFileExist(paths::kAccountingDb) != 0; ++i) {
        DbSession db(paths::kAccountingDb, paths::kAccountingSchema);
        if (db.connect() && db->DBExecute("SELECT 1 FROM histogram") == 0) {
            return;
        }
    }
    if (QLIBCFileExist(paths::kAccountingDb) != 0) {
        syslog(LOG_WARNING, "%s cannot be read: its counts begin again from zero; stop quorlogd to restore it",
               paths::kAccountingDb);
    }
}

void Housekeeping::checkVolume() {
    const double used = usedPercent(options_.volume);
    if (used < 0) {
        syslog(LOG_WARNING, "Cannot check the space of %s: set --volume to a folder that exists",
               options_.volume.c_str());
        return;
    }
    const bool full = used >= options_.volumeFullPercent;
    if (full && !full_) {
        // Both report their own failures.
        (void)NotificationManager().NotificationSendVolFull(options_.volume);
        (void)Logger().LogAddVolFull();
    }
    full_ = full;
}

void Housekeeping::check() {
    completeAll();
    if (options_.volumeFullPercent > 0) {
        checkVolume();
    }
    if (options_.workingDbMaxKb != 0) {
        (void)SyslogngWorkingDbCheck(paths::kWorkingDb, options_.workingDbMaxKb);  // there may be none yet
    }
}

}  // namespace quor
