// Accounting of received logs: counts by device and samples of the log rate. Conventions: see common.h; failures are
// reported through Debuger::MSG.
#ifndef QUORSYSLOG_ACCOUNTING_H
#define QUORSYSLOG_ACCOUNTING_H

#include <cstdint>
#include <list>
#include <map>
#include <memory>
#include <string>

#include "dbutil.h"
#include "notification.h"

#pragma GCC visibility push(default)

// One row of the histogram.
struct QUORLOG_LOG_DEVICE_STATISTIC {
    std::string device;
    unsigned long long count = 0;  // read from the database at start plus counted since
};

// Counts logs in memory and writes closed samples and the histogram to the accounting database.
class AccountingManager {
  public:
    // Loads the notification rules and seeds the histogram from the accounting database; an unreadable one gives an
    // empty histogram.
    AccountingManager();
    AccountingManager(const AccountingManager&) = delete;
    AccountingManager& operator=(const AccountingManager&) = delete;
    // Flushes once more. The open sample is never written.
    ~AccountingManager();

    // Sets the path of the accounting database. Always 0.
    int ConfigLoad();
    // Reads the notification rules again.
    void RulesReload();
    // Counts one log of `device`, after closing the open sample if the second has changed. Always 0.
    int LogInc(std::string device);
    // Closes the open sample if the second has changed and it counted anything; a closed sample is checked against the
    // EPS rules. Always 0.
    int CurEpsUpdate();
    // Logs counted since construction.
    unsigned long long TotalCountGet();
    // Logs in the open sample.
    unsigned long long CurrentEpsGet();
    // True when more than 5 seconds passed since the previous question (not since the previous flush).
    bool isNeed2Flush();
    // A copy of the histogram, in the order in which the devices first appeared.
    std::list<QUORLOG_LOG_DEVICE_STATISTIC> HistogramGet();

    // Writes the closed samples and the histogram to the accounting database in one transaction; without a closed
    // sample it does nothing. -1 keeps the samples for the next flush.
    int AccoutingFlush2DB();
    // Forgets the oldest closed samples until those left hold at most `maxCounts` counts of devices, for an owner whose
    // database cannot be written for long. Returns how many it forgot; the histogram still counts their logs.
    unsigned long long EpsListTrim(unsigned long long maxCounts);
    // Prints the counters as debug messages at a level that the sink drops.
    void AccountingDump();

    // ---- accounting of stored rows, in place of LogInc() and AccoutingFlush2DB(), for an owner that follows a log
    // database by id. What is written is always exactly the rows up to a position, and the position with it, so that
    // counts equal rows after a crash at any moment. An object is used in one of the two ways. A sample holds the rows
    // of one second and bears that second as its stamp, however late they are counted.

    // Counts the row `id`, received from `device` in the Unix second `second`; ids ascend. A row of a later second
    // closes the open sample; one that is up to five seconds older, as rows of several senders may be, counts with the
    // open one. Always 0.
    int RowInc(const std::string& device, long long second, unsigned long long id);
    // Closes the open sample when `now` is a later second than that of its rows, or when the clock was set back behind
    // it. Always 0.
    int RowsUpdate(long long now);
    // Counts of devices that wait in closed samples.
    unsigned long long RowsWaiting();
    // Writes the closed samples, adds their counts to those of the devices, and sets the position of the database
    // `source` behind their last row: all of it, or nothing (-1), when what waits is kept for the next try. `judged` is
    // a position of the owner's own, kept for it; it never goes back.
    int RowsFlush2DB(const std::string& source, unsigned long long judged);
    // The positions of `source`: 1 when there are any, 0 when this database was never followed, -1 when they cannot be
    // read.
    int RowsPositionGet(const std::string& source, unsigned long long& last, unsigned long long& judged);
    // Goes on behind the row `last` of another database. What waits of the one before must be written.
    void RowsPositionSet(unsigned long long last);

  private:
    struct DeviceIndex;

    void Count(const std::string& device);
    void CloseSample(long long stamp);
    void CloseRows();

    std::string dbPath_;
    unsigned long long totalCount_ = 0;
    long long epsStamp_ = 0;
    unsigned long long curEps_ = 0;
    std::map<std::string, int32_t> epsDeviceCount_;
    int32_t lastFlushCheck_ = 0;
    std::list<SYSLOG_LOG_EPS> epsList_;
    std::list<QUORLOG_LOG_DEVICE_STATISTIC> histogram_;
    NotificationManager notifier_;
    std::unique_ptr<DeviceIndex> index_;  // finds the histogram rows of a device

    bool followsRows_ = false;
    long long rowSecond_ = 0;           // of the rows in the open sample
    unsigned long long lastRow_ = 0;    // counted
    unsigned long long closedRow_ = 0;  // the last one in a closed sample
    unsigned long long judgedRow_ = 0;  // as written
};

#pragma GCC visibility pop

#endif
