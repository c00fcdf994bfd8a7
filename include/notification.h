// Notification: the rules and their file, the checks of logs against them, and the senders.
// Conventions: see common.h.
#ifndef QUORSYSLOG_NOTIFICATION_H
#define QUORSYSLOG_NOTIFICATION_H

#include <list>
#include <string>

#include "dbutil.h"

typedef struct QLIBSZHASH_tag QLIBSZHASH;

#pragma GCC visibility push(default)

// One rule: a section of the rule file. Every rule carries all values; only that of its own type counts.
struct _SYSLOG_NOTIFY_RULES_tag {
    std::string name;         // also the section's name
    int32_t notify_type = 0;  // 0 severity, 1 EPS, 2 keyword; others are never checked
    _SYSLOG_DB_PRIORITY_tag notify_pri = SYSLOG_PRIORITY_EMERG;  // this severity or a worse one matches
    int64_t notify_eps = 0;                                      // this many logs in a sample or more match
    std::string notify_pat;                                      // a message that contains it matches; empty: none
    bool notify_enable = false;                                  // only enabled rules are checked
};

// Reads one section of the rule file. -1 (with a line in the system log), and `rule` as it was, when the section is
// absent or lacks a key.
int SyslogNotifyConfGet(const std::string& file, const std::string& section, _SYSLOG_NOTIFY_RULES_tag& rule);
// Writes `rule` as the section `rule.name`, replacing one of that name; the argument `section` is not used. Negative
// numbers are written as the unsigned ones of the same 64 bits, which read back as the largest signed one. -1 (with a
// line in the system log), and the file as it was, when it cannot be written or a text holds a newline or a zero byte.
int SyslogNotifyConfSet(const std::string& file, const std::string& section, _SYSLOG_NOTIFY_RULES_tag& rule);
// True when mail, SMS or a push service is configured on this system. Unreadable settings count as not configured.
bool IsNotificationSet();

// Holds the rules, loaded once at construction; build a new object to pick up changed rules.
class NotificationManager {
  public:
    // Loads the package's rule file. A failure is reported; what was loaded before it counts.
    NotificationManager();
    ~NotificationManager();

    // Appends the rules of `file`. 0 also when a bad section ended the loading early, which is reported.
    int ConfigLoad(std::string file);

    // True when an enabled EPS rule has a threshold at or below `eps`.
    bool CheckEps(unsigned long long eps);
    // True when an enabled severity rule is set to `pri` or to a less severe one.
    bool CheckSev(_SYSLOG_DB_PRIORITY_tag pri);
    // The keyword of the first enabled rule that occurs in `content`, or the empty text.
    std::string CheckKeyword(std::string content);

    // Sends the notice `tag` with the placeholder values in `*table`, to which it adds the desktop class name. Failures
    // of every sender are reported and give -1.
    int NotificationSend(char* tag, QLIBSZHASH** table);
    int NotificationSendEps(unsigned long long eps);
    // Severity and keyword notices. Content that reports a failed mail is dropped (0), so that a broken mail server
    // cannot set off notices about itself. -1 when the content, escaped, does not fit 2,048 bytes with its terminator.
    int NotificationSendSev(std::string host, std::string sev, std::string content);
    int NotificationSendSev(std::string host, _SYSLOG_DB_PRIORITY_tag pri, _SYSLOG_LOG_DATA_tag& log);
    int NotificationSendKeyword(std::string host, std::string keyword, std::string content);
    int NotificationSendKeyword(std::string host, std::string keyword, _SYSLOG_LOG_DATA_tag& log);
    int NotificationSendVolFull(std::string share);

  private:
    std::list<_SYSLOG_NOTIFY_RULES_tag> sevRules_;
    std::list<_SYSLOG_NOTIFY_RULES_tag> epsRules_;
    std::list<_SYSLOG_NOTIFY_RULES_tag> kwRules_;
};

// Notices without rules and without a desktop class name. Null arguments give -1; a failed send is reported to the
// system log.
int SyslogMailSend(const char* tag, QLIBSZHASH** table);
int SyslogMailShareRemove(const char* share);
int SyslogMailShareRename(const char* share);
int SyslogMailShareEncMount(const char* share);
int SyslogMailShareEncUnmount(const char* share);
// These two carry no host. -1 when the content, escaped, does not fit 2,048 bytes with its terminator.
int SyslogMailSeverityExceeded(const char* sev, const char* content);
int SyslogMailKeywordMatched(const char* keyword, const char* content);

#pragma GCC visibility pop

#endif
