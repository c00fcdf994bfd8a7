// The life of the process: new rows, signals and timers.
#ifndef QUORLOGD_DAEMON_H
#define QUORLOGD_DAEMON_H

#include <chrono>

#include "base/guards.h"
#include "tools/quorlogd/housekeeping.h"
#include "tools/quorlogd/options.h"
#include "tools/quorlogd/receiver.h"
#include "tools/quorlogd/watch.h"

namespace quor {

class Daemon {
  public:
    // Blocks the signals that it answers.
    explicit Daemon(const Options& options);
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
    Clock::time_point nextTick_;
    Clock::time_point nextFlush_;
    Clock::time_point nextCheck_;
};

}  // namespace quor

#endif
