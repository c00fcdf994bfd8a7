// The life of the process: new rows, signals and timers.
#ifndef QUORLOGD_DAEMON_H
#define QUORLOGD_DAEMON_H

#include <chrono>

#include "base/guards.h"
#include "tools/quorlogd/crowding.h"
#include "tools/quorlogd/housekeeping.h"
#include "tools/quorlogd/losses.h"
#include "tools/quorlogd/options.h"
#include "tools/quorlogd/receiver.h"
#include "tools/quorlogd/watch.h"

namespace quor {

// Blocks the signals that the process answers, and reads them instead: nothing runs in a handler. To be called before
// anything that takes time, since a signal before it ends the process. Throws std::runtime_error when that cannot be
// done.
Descriptor OpenSignals();

class Daemon {
  public:
    // `signals` is what OpenSignals() gave.
    Daemon(const Options& options, Descriptor signals);
    Daemon(const Daemon&) = delete;
    Daemon& operator=(const Daemon&) = delete;

    // Until SIGTERM or SIGINT. The exit status.
    int run();

  private:
    using Clock = std::chrono::steady_clock;

    void wait();
    void answerSignal();
    void runTimers();

    const Options& options_;
    Descriptor signals_;
    bool stopping_ = false;
    bool more_ = true;  // rows are known to be waiting
    FolderWatch watch_;
    Receiver receiver_;
    Housekeeping housekeeping_;
    Losses losses_;
    Crowding crowding_;
    Clock::time_point nextTick_;
    Clock::time_point nextFlush_;
    Clock::time_point nextCheck_;
};

}  // namespace quor

#endif
