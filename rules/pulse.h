// When and how much one device sends.
#ifndef RULES_PULSE_H
#define RULES_PULSE_H

#include <cstdint>

namespace quor::rules {

constexpr int64_t kMinute = 60;
constexpr int64_t kDay = 86400;

// Times are those of the Clock.
class Pulse {
  public:
    // What outlives the process.
    struct State {
        int64_t first = -1;   // -1: it is known, but was not heard since anybody asked
        int64_t last = -1;    // log
        int64_t second = 0;   // the Unix second of that
        int64_t minutes = 0;  // in which it was heard
        int64_t logs = 0;     // in the minute of the last log
        double longest = 0;   // silence between two logs, forgotten slowly
        double mean = 0;      // logs in a minute in which it was heard, of about a day
        double most = 0;      // logs in a minute, forgotten slowly
    };

    void hear(int64_t now, int64_t second);
    bool wasHeard() const { return state_.first >= 0; }

    // Whether its rhythm is known: a day, night included, with more in it than one burst.
    bool hasRhythm() const;
    // The silence that is unusual for it, by its rhythm.
    int64_t patience() const;

    // Whether enough is known of it to tell what is much.
    bool hasRate() const;
    // Whether the minute is a new one for it; what it had in the last one counts no more with hear().
    bool beginsMinute(int64_t now) const { return wasHeard() && state_.last / kMinute != now / kMinute; }
    // The logs in a minute above which they are `factor` times the usual, and more than it had lately.
    double limit(int64_t factor) const;

    const State& state() const { return state_; }
    void restore(const State& state) { state_ = state; }

  private:
    void learnSilence(int64_t silence);
    void closeMinute(int64_t passed);

    State state_;
};

}  // namespace quor::rules

#endif
