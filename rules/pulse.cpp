#include "rules/pulse.h"

#include <algorithm>

namespace quor::rules {
namespace {

constexpr int64_t kLeastPatience = 10 * kMinute;
constexpr int64_t kRhythmMinutes = 30;  // heard in so many of them
constexpr int64_t kForgotten = 7 * kDay;
constexpr double kLeastLimit = 60;  // logs a minute that are never too many
constexpr int64_t kRateHistory = kDay / 4;
constexpr int64_t kMeanMinutes = kDay / kMinute;

double kept(int64_t silence, int64_t forgotten) {
    return 1 - static_cast<double>(std::min(silence, forgotten)) / static_cast<double>(forgotten);
}

}  // namespace

// One long outage must not make it deaf: what is learnt at once is at most twice what would have been announced.
void Pulse::learnSilence(int64_t silence) {
    const auto learnt = static_cast<double>(std::min(silence, 2 * patience()));
    state_.longest = std::max(state_.longest * kept(silence, kForgotten), learnt);
}

// The same for what it sends.
void Pulse::closeMinute(int64_t passed) {
    const auto logs = static_cast<double>(state_.logs);
    const bool known = hasRate();
    const double mean = known ? std::min(logs, 4 * std::max(state_.mean, kLeastLimit / 10)) : logs;
    const double most = known ? std::min(logs, 2 * limit(10)) : logs;
    state_.mean += (mean - state_.mean) / static_cast<double>(std::clamp<int64_t>(state_.minutes, 1, kMeanMinutes));
    state_.most = std::max(state_.most * kept(passed, kDay), most);
    state_.logs = 0;
}

void Pulse::hear(int64_t now, int64_t second) {
    if (!wasHeard()) {
        state_.first = state_.last = now;
        state_.minutes = 1;
    }
    const int64_t silence = now - state_.last;
    if (silence > 0) {
        learnSilence(silence);
    }
    if (beginsMinute(now)) {
        closeMinute((now / kMinute - state_.last / kMinute) * kMinute);
        ++state_.minutes;
    }
    ++state_.logs;
    state_.last = now;
    state_.second = second;
}

bool Pulse::hasRhythm() const {
    return state_.last - state_.first >= kDay && state_.minutes >= kRhythmMinutes;
}

int64_t Pulse::patience() const {
    return std::max(kLeastPatience, static_cast<int64_t>(2 * state_.longest));
}

bool Pulse::hasRate() const {
    return state_.last - state_.first >= kRateHistory;
}

double Pulse::limit(int64_t factor) const {
    return std::max({kLeastLimit, static_cast<double>(factor) * state_.mean, 2 * state_.most});
}

}  // namespace quor::rules
