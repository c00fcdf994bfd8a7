#include "tests/support/clock.h"

#include <ctime>
#include <optional>

namespace quor::test {
namespace {

std::optional<time_t>& fixedTime() {
    static std::optional<time_t> fixed;
    return fixed;
}

}  // namespace

void SetClock(int64_t now) {
    fixedTime() = static_cast<time_t>(now);
}

void ResetClock() {
    fixedTime().reset();
}

}  // namespace quor::test

extern "C" time_t time(time_t* timer) noexcept {
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    const time_t seconds = quor::test::fixedTime().value_or(now.tv_sec);
    if (timer != nullptr) {
        *timer = seconds;
    }
    return seconds;
}
