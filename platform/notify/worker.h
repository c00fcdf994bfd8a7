// The processes that deliver.
#ifndef PLATFORM_NOTIFY_WORKER_H
#define PLATFORM_NOTIFY_WORKER_H

#include <vector>

#include "base/guards.h"
#include "platform/notify/channels.h"
#include "platform/notify/spool.h"

namespace quor::notify {

// A process to start: it delivers what is due of the channel's queue.
struct Worker {
    const Channel* channel;
    Descriptor slot;
};

// One for each channel that has something due and a free slot.
std::vector<Worker> WorkersNeeded(const Spool& spool);

// Starts them; negative when one cannot be started. The slots pass to them; the caller's copies may be closed at once.
int StartWorkers(const std::vector<Worker>& workers);

}  // namespace quor::notify

#endif
