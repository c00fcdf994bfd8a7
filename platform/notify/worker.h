// The process that delivers.
#ifndef PLATFORM_NOTIFY_WORKER_H
#define PLATFORM_NOTIFY_WORKER_H

#include "base/guards.h"

namespace quor::notify {

// Starts the process that delivers the queue; negative when it cannot be started. The slot passes to it; the caller's
// copy may be closed at once.
int StartWorker(const Descriptor& slot);

}  // namespace quor::notify

#endif
