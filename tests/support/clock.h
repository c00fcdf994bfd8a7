// time() of the test program: real until it is set.
#ifndef TESTS_SUPPORT_CLOCK_H
#define TESTS_SUPPORT_CLOCK_H

#include <cstdint>

namespace quor::test {

// Cut to the width of time_t, which is 32 bits on the appliance.
void SetClock(int64_t now);
void ResetClock();

}  // namespace quor::test

#endif
