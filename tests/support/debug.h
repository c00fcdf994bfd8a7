// The sink of debug messages of the test program, which keeps what the real one drops.
#ifndef TESTS_SUPPORT_DEBUG_H
#define TESTS_SUPPORT_DEBUG_H

#include <string>
#include <vector>

namespace quor::test {

// "LEVEL MESSAGE" of every dropped one since the last call.
std::vector<std::string> TakeDropped();

}  // namespace quor::test

#endif
