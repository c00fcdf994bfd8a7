// Messages that do not reach the log database: the kernel drops datagrams that nobody has taken in time, syslog-ng
// drops what it cannot keep, and both wait while the database cannot be written.
#ifndef QUORLOGD_LOSSES_H
#define QUORLOGD_LOSSES_H

#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "store/receiving.h"
#include "tools/quorlogd/options.h"

namespace quor {

class Losses {
  public:
    explicit Losses(const Options& options);

    // Records and announces what was dropped since the last look, that of a former process included, and whether
    // messages wait because the database takes none.
    void check();

  private:
    // Losses so far, by who had them: they begin anew with each socket and each syslog-ng.
    using Totals = std::map<std::string, uint64_t>;

    void lookAtUdp(Totals& totals) const;
    std::optional<store::ReceiverCounts> lookAtReceiver(Totals& totals);
    void compare(const Totals& totals);
    void watchWaiting(const store::ReceiverCounts& counts);
    void load();
    void save() const;

    const Options& options_;
    Totals totals_;
    int64_t since_ = 0;  // the last look
    store::ReceiverCounts counts_;
    bool stuck_ = false;
    bool complained_ = false;
};

}  // namespace quor

#endif
