// The form in which the system log gets failures of the rules and of the settings.
#ifndef NOTIFICATION_REPORT_H
#define NOTIFICATION_REPORT_H

#include <syslog.h>

#include "common/logplaces.h"

namespace quor {

inline void Report(int place, const char* message) {
    syslog(LOG_ERR, "%s:%d %s", "utils", place, message);
}

}  // namespace quor

#endif
