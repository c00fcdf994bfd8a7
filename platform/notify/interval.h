// When the last notice of a tag (and host) was sent, and how many were held back since.
#ifndef PLATFORM_NOTIFY_INTERVAL_H
#define PLATFORM_NOTIFY_INTERVAL_H

#include <cstddef>
#include <cstdint>

#include "platform/notify/notice.h"

namespace quor::notify {

// One record of the ledger, which is a file that the caller has locked.
class Interval {
  public:
    Interval(int ledger, const Notice& notice);

    // A clock that was set back makes a notice due.
    bool due(int32_t seconds, int64_t now) const;
    uint32_t heldBack() const { return record_.heldBack; }
    // Both are false when the ledger could not be written.
    bool countHeldBack();
    bool countSent(int32_t seconds, int64_t now);

  private:
    struct Record {
        char key[240];  // tag and host, filled up with zero bytes
        int64_t sent;
        uint32_t heldBack;
        uint32_t reserved;
    };

    bool store() const;

    int ledger_;
    size_t position_ = 0;
    Record record_{};
};

}  // namespace quor::notify

#endif
