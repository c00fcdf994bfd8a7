// What becomes of each line: it is parsed, accounted and checked against the rules.
#ifndef QUORLOGD_RECEIVER_H
#define QUORLOGD_RECEIVER_H

#include <cstdint>
#include <string>

#include "accounting.h"
#include "notification.h"
#include "parser.h"
#include "tools/quorlogd/bounds.h"
#include "tools/quorlogd/linesplitter.h"
#include "tools/quorlogd/options.h"

namespace quor {

class Receiver {
  public:
    explicit Receiver(const Options& options);

    void take(std::string_view chunk);
    // Nothing follows: takes the last line, closes the open sample and writes what is there.
    void finish();
    // Closes the open sample when its second has passed.
    void tick() { (void)accounting_.CurEpsUpdate(); }  // cannot fail
    // Writes when the library says that it is time to. False when the database did not take it; what waits is then
    // bounded.
    bool flushIfDue() { return !accounting_.isNeed2Flush() || flush(); }
    bool flush();
    void reloadRules();
    // Reports the lines that could not be read since the last report.
    void reportBadLines();
    std::string statistics() const;

  private:
    void takeLine(const std::string& line);
    void checkRules(const _SYSLOG_LOG_DATA_tag& record);
    bool mayNotify();
    void closeSample();

    struct Counters {
        uint64_t lines = 0;
        uint64_t bad = 0;
        uint64_t badReported = 0;
        uint64_t notices = 0;
        uint64_t suppressed = 0;
        uint64_t failedFlushes = 0;
        uint64_t forgottenSamples = 0;
    };

    unsigned long long maxWaiting_;
    LineSplitter splitter_;
    LogParser parser_;
    _SYSLOG_LOG_DATA_tag record_;
    AccountingManager accounting_;
    NotificationManager rules_;
    NoticeBudget budget_;
    DeviceNames devices_;
    Counters counters_;
};

}  // namespace quor

#endif
