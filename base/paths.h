// Every fixed path of the system. QUOR_ROOT is empty in a release; test and demonstration builds put a folder there.
#ifndef BASE_PATHS_H
#define BASE_PATHS_H

#include "quor_root.h"  // made by the build: QUOR_ROOT

namespace quor::paths {

// Databases.
constexpr const char kWorkingDb[] = QUOR_ROOT "/var/log/quorlog/syslog.db";  // written by syslog-ng
constexpr const char kAccountingDb[] = QUOR_ROOT "/var/log/quorlog/.QUORACCOUNTDB";
constexpr const char kEventDb[] = QUOR_ROOT "/usr/quor/etc/quorsyslog.db";

// Schemas that databases are created from.
constexpr const char kAccountingSchema[] = QUOR_ROOT "/usr/quor/syslog/schema/accinfo.sql";
constexpr const char kEventSchema[] = QUOR_ROOT "/usr/quor/syslog/schema/quorsyslog.sql";
constexpr const char kLogSchema[] = QUOR_ROOT "/usr/quor/syslog/schema/syslog.sql";

// Notification.
constexpr const char kNotifyRules[] = QUOR_ROOT "/etc/quorsyslog/notify.conf";
constexpr const char kRules[] = QUOR_ROOT "/etc/quorsyslog/rules.conf";
constexpr const char kRulesState[] = QUOR_ROOT "/var/log/quorlog/.quorrules";  // what is known of the devices
constexpr const char kNotifyFilter[] = QUOR_ROOT "/etc/quorsyslog/notify.filter";
constexpr const char kNotifyTexts[] = QUOR_ROOT "/usr/quor/quorman/webman/modules/Orvane/texts/";
constexpr const char kNotifySpool[] = QUOR_ROOT "/var/spool/quornotify";
constexpr const char kSystemSettings[] = QUOR_ROOT "/etc/quorinfo.conf";

// Service control.
constexpr const char kPackageEnabled[] = QUOR_ROOT "/var/packages/Orvane/enabled";
constexpr const char kReceiverPid[] = QUOR_ROOT "/run/quorlogd.pid";
constexpr const char kReceiverValues[] = QUOR_ROOT "/etc/quorsyslog";  // receiving*.conf
constexpr const char kReceiverControl[] = QUOR_ROOT "/var/lib/syslog-ng/syslog-ng.ctl";
constexpr const char kRunFolder[] = QUOR_ROOT "/run";

// Programs: never below QUOR_ROOT.
constexpr const char kShell[] = "/bin/sh";
constexpr const char kSqliteShell[] = "/usr/bin/sqlite3";

}  // namespace quor::paths

#endif
