// time() of the test program: real until it is set.
#ifndef TESTS_SUPPORT_CLOCK_H
#define TESTS_SUPPORT_CLOCK_H

#include <ctime>

namespace quor::test {

void SetClock(time_t now);
void ResetClock();

}  // namespace quor::test

#endif
