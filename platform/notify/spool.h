// The folder between the caller's process and the workers: queued notices, the ledger of intervals and the workers'
// slots.
#ifndef PLATFORM_NOTIFY_SPOOL_H
#define PLATFORM_NOTIFY_SPOOL_H

#include <optional>

#include "base/guards.h"
#include "platform/notify/notice.h"

namespace quor::notify {

constexpr int kWaitForever = -1;

// The spool folder, locked from construction to destruction. Nothing slow is done in between.
class Spool {
  public:
    // False when the folder cannot be used or stays locked for `waitMs`.
    explicit Spool(int waitMs);
    explicit operator bool() const { return static_cast<bool>(ledger_); }

    int ledger() const { return ledger_.get(); }
    bool full() const;
    // False when it could not be written.
    bool put(const Notice& notice) const;
    // Takes the oldest notice out of the queue, so that a crash while it is delivered cannot repeat forever.
    std::optional<Notice> take() const;
    // One of the few permissions to deliver, held as long as the descriptor is open in any process.
    Descriptor freeSlot() const;

  private:
    Descriptor ledger_;
};

}  // namespace quor::notify

#endif
