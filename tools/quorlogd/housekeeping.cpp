#include "quorlogd/housekeeping.h"

#include <sys/statvfs.h>
#include <syslog.h>

#include "common/paths.h"
#include "dbhandler.h"
#include "logger.h"
#include "notification.h"

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

}  // namespace

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
    if (options_.volumeFullPercent > 0) {
        checkVolume();
    }
    if (options_.workingDbMaxKb != 0) {
        (void)SyslogngWorkingDbCheck(paths::kWorkingDb, options_.workingDbMaxKb);  // there may be none yet
    }
}

}  // namespace quor
