// What most tests need.
#ifndef TESTS_SUPPORT_TESTING_H
#define TESTS_SUPPORT_TESTING_H

#include <gtest/gtest.h>
#include <stdlib.h>
#include <unistd.h>

#include "common/paths.h"
#include "support/sqlite_file.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace quor::test {

using Strings = std::vector<std::string>;

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
