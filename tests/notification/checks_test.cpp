#include <gtest/gtest.h>

#include "common/paths.h"
#include "notification.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

using Lines = std::vector<std::string>;

std::string section(const std::string& name, int type, int pri, int64_t eps, const std::string& pattern, int enable) {
    return "[" + name + "]\nnotify_type=\"" + std::to_string(type) + "\"\nnotify_pri=\"" + std::to_string(pri) +
           "\"\nnotify_eps=\"" + std::to_string(eps) + "\"\nnotify_pat=\"" + pattern + "\"\nnotify_enable=\"" +
           std::to_string(enable) + "\"\n";
}

class Checks : public testing::Test {
  protected:
    int load(const std::string& rules) {
        quor::test::TakeSystemLog();
        return manager_.ConfigLoad(folder_.write("notify.conf", rules));
    }

    // The package's own rule file is not there.
    static NotificationManager withoutRules() {
        std::filesystem::remove(quor::paths::kNotifyRules);
        quor::test::TakeSystemLog();
        return {};
    }

    const quor::test::TempFolder folder_;
    NotificationManager manager_ = withoutRules();
};

TEST_F(Checks, LoadingStopsAtABadSection) {
    EXPECT_EQ(quor::test::TakeSystemLogTexts(),
              (Lines{"Fail to do QLIBCFileEnumSection", "Fail to load configuration"}));
    EXPECT_EQ(load(section("a", 1, 0, 100, "", 1) + "[bad]\nnotify_type=1\n" + section("b", 1, 0, 10, "", 1)), 0);
    EXPECT_EQ(quor::test::TakeSystemLogTexts(),
              (Lines{"utils:85 Fail to do QLIBCFileGetSection", "Fail to get notification setting bad"}));
    EXPECT_TRUE(manager_.CheckEps(100));
    EXPECT_FALSE(manager_.CheckEps(99));
}

TEST_F(Checks, OnlyEnabledRulesOfTheKindCount) {
    ASSERT_EQ(load(section("off", 1, 7, 0, "x", 0) + section("other", 3, 7, 0, "x", 1) +
                   section("-1", -1, 7, 0, "x", 1) + section("e", 1, 7, -1, "x", 1) + section("s", 0, 3, 0, "x", 1)),
              0);
    EXPECT_FALSE(manager_.CheckEps(UINT64_MAX - 1));
    EXPECT_TRUE(manager_.CheckEps(UINT64_MAX)) << "thresholds compare unsigned";
    EXPECT_TRUE(manager_.CheckSev(SYSLOG_PRIORITY_EMERG));
    EXPECT_TRUE(manager_.CheckSev(SYSLOG_PRIORITY_ERR));
    EXPECT_FALSE(manager_.CheckSev(SYSLOG_PRIORITY_WARNING));
    EXPECT_EQ(manager_.CheckKeyword("x"), "");
}

TEST_F(Checks, TheFirstKeywordInFileOrderIsGiven) {
    ASSERT_EQ(load(section("empty", 2, 0, 0, "", 1) + section("off", 2, 0, 0, "volume", 0) +
                   section("long", 2, 0, 0, "disk full", 1) + section("short", 2, 0, 0, "disk", 1)),
              0);
    EXPECT_EQ(manager_.CheckKeyword("disk full on volume"), "disk full");
    EXPECT_EQ(manager_.CheckKeyword(std::string("\0a disk", 7)), "disk");
    EXPECT_EQ(manager_.CheckKeyword("a Disk"), "");
}

}  // namespace
