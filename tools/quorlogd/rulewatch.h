// The rules of rules.conf at work.
#ifndef QUORLOGD_RULEWATCH_H
#define QUORLOGD_RULEWATCH_H

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

#include "accounting.h"
#include "rules/devicewatch.h"
#include "rules/matches.h"
#include "tools/quorlogd/alarms.h"
#include "tools/quorlogd/options.h"

namespace quor {

class RuleWatch {
  public:
    // `alarms` decides which matches are announced.
    RuleWatch(const Options& options, Alarms& alarms);

    // Reads the rules. When they are not understood, this is told, and those of before stay in force. Devices that
    // were counted are not new.
    void reload(AccountingManager& counted);
    // A log received in that second, which is counted under the name `device`: its host's own unless that is one of
    // those that are counted together.
    void hear(const store::Record& record, const std::string& device, int64_t second);
    // True when it became a notice.
    bool match(const store::Record& record, const std::string& device, int64_t second);
    // Once a second. `reading`: what is stored was read up to now.
    void tick(bool reading);
    // Announces what waits, and keeps what is known of the devices.
    void finish();

  private:
    using Clock = std::chrono::steady_clock;

    void apply(const std::vector<rules::Rule>& all, AccountingManager& counted);
    void load();
    void save(bool clean);
    void announce(const std::vector<rules::Report>& reports);
    void announce(const rules::Rule& rule, const store::Record& record);

    Alarms& alarms_;
    rules::Matches matches_;
    rules::DeviceWatch devices_;
    bool loaded_ = false;      // the state
    bool complained_ = false;  // that it cannot be kept
    Clock::time_point ticked_;
    Clock::time_point nextLook_;
    Clock::time_point nextSave_;
};

}  // namespace quor

#endif
