#include "tools/quorlogd/housekeeping.h"

#include <sys/statvfs.h>
#include <syslog.h>

#include <string>

#include "base/paths.h"
#include "dbhandler/session.h"
#include "logger.h"
#include "notification.h"
#include "quor/quorcore.h"
#include "store/databasefile.h"

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

// A database of a former version lacks a table; one that was created on a full volume has none. Neither is created
// again, because it is there.
void complete(const char* path, const char* schema, const char* table) {
    DbSession db(path, schema);
    if (QLIBCFileExist(path) != 0 && db.connect() && db->DBcheckTableExist(table) == 0) {
        (void)db->DBCreate();  // reports its own failure, and leaves tables that are there alone
    }
}

void completeAll() {
    complete(paths::kEventDb, paths::kEventSchema, "log");
    complete(paths::kAccountingDb, paths::kAccountingSchema, "followed");
}

}  // namespace

void PrepareDatabases() {
    completeAll();
}

// The oldest events go in time, so that the library never compacts the file to make room: that would hold up whoever
// adds an event.
void Housekeeping::trimEvents() {
    constexpr int kMost = 15000;
    constexpr int kKept = 10000;
    if (Logger().LogCount(paths::kEventDb) <= kMost) {
        return;
    }
    DbSession db(paths::kEventDb, paths::kEventSchema);
    if (db.connect()) {
        (void)db->DBExecute("DELETE FROM log WHERE id <= (SELECT max(id) FROM log) - " + std::to_string(kKept));
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
    trimEvents();
    if (options_.volumeFullPercent > 0) {
        checkVolume();
    }
    if (options_.workingDbMaxKb != 0 &&
        store::SizeOf(options_.db) / 1024 > static_cast<uint64_t>(options_.workingDbMaxKb)) {
        store::RemoveCompanions(options_.db);
        (void)SyslogngWorkingDbCheck(options_.db, options_.workingDbMaxKb);  // there may be none yet
    }
}

}  // namespace quor
