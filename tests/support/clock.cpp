#include "support/clock.h"

#include <ctime>
#include <optional>

namespace {

std::optional<time_t>& fixedTime() {
    static std::optional<time_t> fixed;
    return fixed;
}

time_t realTime() {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    return now.tv_sec;
}

}  // namespace

namespace quor::test {

void SetClock(int64_t now) {
    fixedTime() = static_cast<time_t>(now);
}

void ResetClock() {
    fixedTime().reset();
}

}  // namespace quor::test

extern "C" time_t time(time_t* timer) noexcept {
    const time_t now = fixedTime() ? *fixedTime() : realTime();
    if (timer != nullptr) {
        *timer = now;
    }
    return now;
}
