// The time in which logs were received, by the seconds of the logs themselves. It stands still while nothing can be
// received: what happens to every device at once says nothing about one of them.
#ifndef RULES_CLOCK_H
#define RULES_CLOCK_H

#include <cstdint>

namespace quor::rules {

class Clock {
  public:
    // What outlives the process.
    struct State {
        int64_t now = 0;      // seconds since it began
        int64_t newest = -1;  // Unix second of the newest log
        double usual = 0;     // the longest time that no device is heard, forgotten slowly
    };

    // A log, received in that Unix second. A jump of the machine's clock, a sleep and an outage count for no more than
    // the patience does.
    void hear(int64_t second);
    // So many seconds have passed in which no log came, though it would have been read.
    void elapse(double seconds) { quiet_ += seconds; }

    int64_t ofLogs() const { return state_.now; }
    int64_t now() const;
    // Seconds since the last log.
    int64_t quiet() const { return static_cast<int64_t>(quiet_); }
    // How long it may be quiet before something must be wrong with the reception itself.
    int64_t patience() const;
    // Whether reception has just begun again, and senders deliver what they held back.
    bool resumes() const;

    const State& state() const { return state_; }
    void restore(const State& state) { state_ = state; }

  private:
    State state_;
    double quiet_ = 0;
    int64_t resumed_ = -1;
};

}  // namespace quor::rules

#endif
