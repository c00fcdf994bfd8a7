// What becomes of each stored row: it is accounted and checked against the rules, once.
#ifndef QUORLOGD_RECEIVER_H
#define QUORLOGD_RECEIVER_H

#include <cstdint>
#include <memory>
#include <string>

#include "accounting.h"
#include "notification.h"
#include "store/follower.h"
#include "tools/quorlogd/alarms.h"
#include "tools/quorlogd/devices.h"
#include "tools/quorlogd/options.h"
#include "tools/quorlogd/rulewatch.h"

namespace quor {

class Receiver {
  public:
    explicit Receiver(const Options& options);

    // Takes a piece of the rows that have arrived. False when there is no more for now, or when the accounting database
    // has to be written first. What keeps it from reading is reported, and tried again with the next call.
    bool takeRows();
    // Closes the open sample when its second has passed.
    void tick();
    // Writes what was counted. False when the database did not take it.
    bool flush();
    // Takes what is there, and writes it.
    void finish();
    void reloadRules();
    // Records and announces what was held back since the last call.
    void announceHeldBack();
    std::string statistics() const;

  private:
    uint64_t start(const std::string& identity);
    void take(const store::Record& record);
    std::string keywordIn(const store::Record& record);
    void judge(const store::Record& record, const std::string& device);
    void tellChannels();
    void report(const std::string& trouble);
    void replaceDamaged();

    struct Counters {
        uint64_t rows = 0;
        uint64_t failedFlushes = 0;
    };

    const Options& options_;
    std::unique_ptr<store::Source> source_;
    store::Follower follower_;
    AccountingManager accounting_;
    NotificationManager rules_;
    Alarms alarms_;
    Devices devices_;
    RuleWatch ruleWatch_;
    unsigned long long judged_ = 0;  // rows up to this one need not be judged any more
    bool matched_ = false;           // since the position was written
    bool caughtUp_ = false;
    bool channelsTold_ = false;  // that there is none
    std::string trouble_;        // reported last
    unsigned damagedLooks_ = 0;
    Counters counters_;
};

}  // namespace quor

#endif
