#include <gtest/gtest.h>
#include <syslog.h>

#include "common.h"
#include "support/system_log.h"

using quor::test::TakeSystemLog;

TEST(Debuger, WritesOnlyLevelsBelowOneAndLeavesPercentSignsAlone) {
    TakeSystemLog();
    for (const int level : {-1, 0, 1, 2}) {
        Debuger::MSG(level, "100%s %n");
    }
    Debuger::MSG(0, "");

    const auto lines = TakeSystemLog();
    ASSERT_EQ(lines.size(), 3U);
    for (const auto& line : lines) {
        EXPECT_EQ(line.priority, LOG_ERR);
    }
    EXPECT_EQ(lines[0].text, "100%s %n");
    EXPECT_EQ(lines[1].text, "100%s %n");
    EXPECT_EQ(lines[2].text, "");
}
