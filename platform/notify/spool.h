// The folder between the callers' processes and the workers: queued notices, the ledger of intervals, the workers'
// slots, and word of notices that were given up.
#ifndef PLATFORM_NOTIFY_SPOOL_H
#define PLATFORM_NOTIFY_SPOOL_H

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "base/guards.h"
#include "platform/notify/notice.h"

namespace quor::notify {

constexpr int kWaitForever = -1;

// A notice that is being delivered. It stays in the queue, and no other worker gets it while this lives: when its
// worker dies, it is tried again.
struct Delivery {
    Notice notice;
    unsigned tries = 0;  // with this one
    std::string path;
    Descriptor lock;

    bool isLast() const;
    // Takes it out of the queue.
    void remove() const;
};

// The spool folder, locked from construction to destruction. Nothing slow is done in between. Channels are named; each
// has a queue and slots of its own, so that a slow one holds up nothing but itself.
class Spool {
  public:
    // False when the folder cannot be used or stays locked for `waitMs`.
    explicit Spool(int waitMs);
    explicit operator bool() const { return static_cast<bool>(ledger_); }

    int ledger() const { return ledger_.get(); }
    // False as long as something could give way.
    bool full(const char* channel) const;
    // False when it could not be written.
    bool put(const char* channel, const Notice& notice) const;
    // The next notice whose time has come; those that failed least come first.
    std::optional<Delivery> take(const char* channel, int64_t now) const;
    bool isAnyDue(const char* channel, int64_t now) const;
    // One of the few permissions to deliver, held as long as the descriptor is open in any process.
    Descriptor freeSlot(const char* channel) const;
    // Remembers a notice that is not delivered, and the cause on one line, for TakeGivenUp().
    void giveUp(const char* channel, const Notice& notice, const std::string& cause) const;

  private:
    void makeRoom(const char* channel) const;

    Descriptor ledger_;
};

using GivenUpHandler = std::function<void(const char* channel, const char* subject, const char* cause)>;

// Hands over what was given up since the last call, while the spool is not locked. What a crash interrupts is handed
// over again. The number of notices, negative when the folder cannot be used.
int TakeGivenUp(int waitMs, const GivenUpHandler& handler);

}  // namespace quor::notify

#endif
