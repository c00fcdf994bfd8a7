// What a forked process gives back of its parent's.
#ifndef PLATFORM_NOTIFY_PROCESS_H
#define PLATFORM_NOTIFY_PROCESS_H

namespace quor::notify {

// Every descriptor from `first` on.
void CloseFrom(int first);
// Every signal does what it does by itself, and none is blocked.
void ResetSignals();

}  // namespace quor::notify

#endif
