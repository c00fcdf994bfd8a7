// What most tests need.
#ifndef TESTS_SUPPORT_TESTING_H
#define TESTS_SUPPORT_TESTING_H

#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include "base/paths.h"
#include "tests/support/sqlite_file.h"
#include "tests/support/system_log.h"
#include "tests/support/temp_folder.h"

namespace quor::test {

using Strings = std::vector<std::string>;

// What a call answered and the last message that it left in the system log: "-1 Fail to connect db".
inline std::string Said(const std::string& answer) {
    const Strings messages = TakeSystemLogTexts();
    return answer + " " + (messages.empty() ? "" : messages.back());
}
inline std::string Said(long long answer) {
    return Said(std::to_string(answer));
}

// Polls for at most ten seconds.
template <typename Condition>
bool Eventually(Condition holds) {
    bool held = holds();
    for (int i = 0; i < 1000 && !held; ++i) {
        usleep(10000);
        held = holds();
    }
    return held;
}

}  // namespace quor::test

#endif
