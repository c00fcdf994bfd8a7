#include "tests/support/clock.h"

#include <ctime>
#include <optional>

namespace {

std::optional<time_t> fixed;

}  // namespace

void quor::test::SetClock(int64_t now) {
    fixed = static_cast<time_t>(now);
}

void quor::test::ResetClock() {
    fixed.reset();
}

extern "C" time_t time(time_t* timer) noexcept {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    const time_t seconds = fixed.value_or(now.tv_sec);
    if (timer != nullptr) {
        *timer = seconds;
    }
    return seconds;
}
