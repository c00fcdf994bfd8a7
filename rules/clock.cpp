#include "rules/clock.h"

#include <algorithm>

namespace quor::rules {
namespace {

constexpr int64_t kSetBack = 300;  // logs of several connections are never that much out of order
constexpr int64_t kLeastPatience = 60;
constexpr int64_t kMostPatience = 86400;
constexpr int64_t kForgotten = 86400;  // seconds after which a quiet time says nothing any more
constexpr int64_t kCatchingUp = 120;   // seconds

}  // namespace

int64_t Clock::patience() const {
    return std::clamp(static_cast<int64_t>(2 * state_.usual), kLeastPatience, kMostPatience);
}

int64_t Clock::now() const {
    return state_.now + std::min(quiet(), patience());
}

bool Clock::resumes() const {
    return resumed_ >= 0 && state_.now - resumed_ < kCatchingUp;
}

void Clock::hear(int64_t second) {
    quiet_ = 0;
    const bool first = state_.newest < 0 || second < state_.newest - kSetBack;
    if (first || second <= state_.newest) {
        state_.newest = first ? second : state_.newest;
        return;
    }
    const int64_t passed = second - state_.newest;
    const int64_t counted = std::min(passed, patience());
    const double kept = 1 - static_cast<double>(std::min(counted, kForgotten)) / kForgotten;
    state_.newest = second;
    state_.now += counted;
    resumed_ = passed > counted ? state_.now : resumed_;
    state_.usual = std::max(state_.usual * kept, static_cast<double>(counted));
}

}  // namespace quor::rules
