// The life of the process: standard input, signals and timers.
#ifndef QUORLOGD_DAEMON_H
#define QUORLOGD_DAEMON_H

#include <array>
#include <chrono>

#include "base/guards.h"
#include "tools/quorlogd/housekeeping.h"
#include "tools/quorlogd/options.h"
#include "tools/quorlogd/receiver.h"

namespace quor {

class Daemon {
  public:
    // Blocks the signals that it answers. Standard input is `input`.
    Daemon(const Options& options, int input);
    Daemon(const Daemon&) = delete;
    Daemon& operator=(const Daemon&) = delete;

    // Until the end of input or SIGTERM or SIGINT. The exit status.
    int run();

  private:
    using Clock = std::chrono::steady_clock;

    void wait();
    bool read();
    void drain();
    void answerSignal();
    void runTimers();

    const Options& options_;
    int input_;
    Descriptor signals_;
    bool stopping_ = false;
    Receiver receiver_;
    Housekeeping housekeeping_;
    Clock::time_point nextTick_;
    Clock::time_point nextFlush_;
    Clock::time_point nextCheck_;
    std::array<char, 65536> buffer_{};
};

}  // namespace quor

#endif
