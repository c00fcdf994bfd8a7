// The package's own event log, in an SQLite database of its own. Conventions: see common.h; failures are reported
// through Debuger::MSG.
//
// Texts are not escaped on their way into the database or the HTML page. One with an apostrophe is usually refused (-1)
// and never stored in part, but a crafted one can add events of its own: callers keep apostrophes out of what strangers
// wrote. See docs/security.md.
#ifndef QUORSYSLOG_LOGGER_H
#define QUORSYSLOG_LOGGER_H

#include <cstdint>
#include <list>
#include <string>

#include "dbutil.h"

#pragma GCC visibility push(default)

// One event.
struct _SSYSLOG_LOG_LOG_tag {
    int32_t id = 0;
    int32_t level = 0;  // 0 Information, 1 Warning, 2 Error
    int64_t time = 0;   // Unix seconds
    std::string user;
    std::string event;
};

// Has no state: every call opens its own connection and closes it.
class Logger {
  public:
    Logger();
    ~Logger();

    // Appends one event, creating the database when it is missing, and then calls LogRotation(), whose failure is
    // reported but changes nothing in the result.
    int LogAdd(std::string dbPath, int level, std::string user, std::string event);
    // Number of events (low 32 bits); -1 on failure, -2 when the result is not one row. The path must be absolute; the
    // file is never created.
    int LogCount(std::string dbPath);
    // From 20000 events on: removes those without a time and compacts the file. 0 also when there was nothing to do.
    int LogRotation(std::string dbPath);

    // Each records one event of the package in the package's event database. -1 when it was not stored.
    int LogAddServStart(std::string text);
    int LogAddServStop(std::string text);
    int LogAddNotifyEps(unsigned long long limit);
    int LogAddNotifySev(std::string severity, std::string content);
    int LogAddNotifySev(_SYSLOG_DB_PRIORITY_tag priority, std::string content);
    int LogAddNotifyKw(std::string keyword, std::string content);
    int LogAddArchStart(std::string database);
    int LogAddArchFinish(std::string database);
    int LogAddArchFailed(std::string database);
    int LogAddLogClear(std::string path, std::string user);
    int LogAddVolFull();

    // Events, newest first. A limit of 0 means all of them, and the offset is then ignored. Empty on failure.
    std::list<_SSYSLOG_LOG_LOG_tag> LogEnum(std::string dbPath, int offset, int limit);
    // Writes all events as an HTML page. `extra` must not be empty and has no effect. 0 without a page when there are
    // no events or the file cannot be opened; -1 only for an empty argument.
    int LogHtmlGen(std::string dbPath, std::string extra, std::string outPath);
    // Deletes such a page. -1 when it cannot be deleted.
    int LogHtmlRemove(std::string outPath);
    // Deletes the database file and records who did it in the package's event database. Always 0.
    int LogClear(std::string dbPath, std::string user);
};

// Name of an event level; the empty text outside 0 to 2.
std::string strLevelGet(int level);
// The same into a buffer of `size` bytes, truncated to fit. -1 for a null buffer.
int szLevelGet(int level, char* buffer, int size);

#pragma GCC visibility pop

#endif
