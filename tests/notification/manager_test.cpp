#include <gtest/gtest.h>

#include <filesystem>

#include "common/paths.h"
#include "notification.h"
#include "support/notices.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

using Lines = std::vector<std::string>;
using quor::test::FakeNotices;
using quor::test::TakeSystemLogTexts;

std::string section(const std::string& name, int type, int pri, int64_t eps, const std::string& pattern, int enable) {
    return "[" + name + "]\nnotify_type=\"" + std::to_string(type) + "\"\nnotify_pri=\"" + std::to_string(pri) +
           "\"\nnotify_eps=\"" + std::to_string(eps) + "\"\nnotify_pat=\"" + pattern + "\"\nnotify_enable=\"" +
           std::to_string(enable) + "\"\n";
}

class Manager : public testing::Test {
  protected:
    Manager() {
        TakeSystemLogTexts();
        FakeNotices() = {};
    }

    int load(const std::string& rules) { return manager_.ConfigLoad(folder_.write("notify.conf", rules)); }

    const quor::test::TempFolder folder_;
    NotificationManager manager_;  // without rules: the package's own file is not there
};

TEST_F(Manager, ReportsAMissingRuleFile) {
    std::filesystem::remove(quor::paths::kNotifyRules);
    const NotificationManager another;
    EXPECT_EQ(TakeSystemLogTexts(), (Lines{"Fail to do QLIBCFileEnumSection", "Fail to load configuration"}));
}

TEST_F(Manager, StopsLoadingAtABadSection) {
    EXPECT_EQ(load(section("a", 1, 0, 100, "", 1) + "[bad]\nnotify_type=1\n" + section("b", 1, 0, 10, "", 1)), 0);
    EXPECT_EQ(TakeSystemLogTexts(),
              (Lines{"utils:85 Fail to do QLIBCFileGetSection", "Fail to get notification setting bad"}));
    EXPECT_TRUE(manager_.CheckEps(100));
    EXPECT_FALSE(manager_.CheckEps(99));
}

TEST_F(Manager, ChecksOnlyEnabledRulesOfTheKind) {
    ASSERT_EQ(load(section("off", 1, 7, 0, "x", 0) + section("other", 3, 7, 0, "x", 1) +
                   section("e", 1, 7, -1, "x", 1) + section("s", 0, 3, 0, "x", 1)),
              0);
    EXPECT_FALSE(manager_.CheckEps(UINT64_MAX - 1));
    EXPECT_TRUE(manager_.CheckEps(UINT64_MAX)) << "thresholds compare unsigned";
    EXPECT_TRUE(manager_.CheckSev(SYSLOG_PRIORITY_EMERG));
    EXPECT_TRUE(manager_.CheckSev(SYSLOG_PRIORITY_ERR));
    EXPECT_FALSE(manager_.CheckSev(SYSLOG_PRIORITY_WARNING));
    EXPECT_EQ(manager_.CheckKeyword("x"), "");
}

TEST_F(Manager, GivesTheFirstKeywordInFileOrder) {
    ASSERT_EQ(load(section("empty", 2, 0, 0, "", 1) + section("off", 2, 0, 0, "volume", 0) +
                   section("long", 2, 0, 0, "disk full", 1) + section("short", 2, 0, 0, "disk", 1)),
              0);
    EXPECT_EQ(manager_.CheckKeyword("disk full on volume"), "disk full");
    EXPECT_EQ(manager_.CheckKeyword("a disk"), "disk");
    EXPECT_EQ(manager_.CheckKeyword("a Disk"), "");
    EXPECT_EQ(manager_.CheckKeyword(""), "");
    EXPECT_EQ(manager_.CheckKeyword(std::string("\0disk", 5)), "disk");
}

TEST_F(Manager, FillsThePlaceholdersOfEachNotice) {
    using Values = std::map<std::string, std::string>;
    _SYSLOG_LOG_DATA_tag log;
    log.msg = "a\"b\\c\nd";
    EXPECT_EQ(manager_.NotificationSendEps(UINT64_MAX), 0);
    EXPECT_EQ(manager_.NotificationSendSev("h", SYSLOG_PRIORITY_ERR, log), 0);
    EXPECT_EQ(manager_.NotificationSendKeyword("h", "k\"", log), 0);
    EXPECT_EQ(manager_.NotificationSendVolFull("share"), 0);
    const struct {
        const char* tag;
        Values values;
    } wanted[] = {
        {"QUORSYSLOG_EPS_EXCEED", {{"%EPS%", "18446744073709551615"}}},
        {"QUORSYSLOG_SEV_EXCEED", {{"%HOST%", "h"}, {"%SEV%", "err"}, {"%SYSLOG_CONTENT%", "a\\\"b\\\\c\nd"}}},
        {"QUORSYSLOG_KEYWORD_MATCH", {{"%HOST%", "h"}, {"%KEYWORD%", "k\""}, {"%SYSLOG_CONTENT%", "a\\\"b\\\\c\nd"}}},
        {"QUORSYSLOG_VOL_FULL", {{"%SHARED_FOLDER%", "share"}}},
    };
    ASSERT_EQ(FakeNotices().sent.size(), std::size(wanted));
    for (size_t i = 0; i < std::size(wanted); ++i) {
        const quor::test::Notice& sent = FakeNotices().sent[i];
        Values values = wanted[i].values;
        values["DESKTOP_NOTIFY_CLASSNAME"] = "QUOR.KVX.Orvane.Instance";
        EXPECT_EQ(sent.tag, wanted[i].tag);
        EXPECT_EQ(sent.values, values);
        EXPECT_EQ(sent.textsDir, quor::paths::kNotifyTexts);
        EXPECT_EQ(sent.filterFile, quor::paths::kNotifyFilter);
    }
}

TEST_F(Manager, DropsContentAboutFailedMailAndRefusesTooMuch) {
    const struct {
        std::string content;
        int result;
        size_t sent;
        Lines log;
    } cases[] = {
        {"x Failed to send email. y", 0, 0, {}},
        {"failed to send email.", 0, 1, {}},
        {std::string(2047, 'x'), 0, 1, {}},
        {std::string(2048, 'x'), -1, 0, {"Not enough memory"}},
        {std::string(1023, '"') + "x", 0, 1, {}},
        {std::string(1024, '"'), -1, 0, {"Not enough memory"}},
        {"Failed to send email." + std::string(4096, 'x'), 0, 0, {}},
    };
    for (const auto& row : cases) {
        for (const bool keyword : {false, true}) {
            FakeNotices() = {};
            EXPECT_EQ(keyword ? manager_.NotificationSendKeyword("h", "k", row.content)
                              : manager_.NotificationSendSev("h", std::string("err"), row.content),
                      row.result);
            EXPECT_EQ(FakeNotices().sent.size(), row.sent) << row.content;
            EXPECT_EQ(TakeSystemLogTexts(), row.log);
        }
    }
}

TEST_F(Manager, ReportsAFailedSendTwice) {
    FakeNotices().fail = true;
    EXPECT_EQ(manager_.NotificationSendVolFull("s"), -1);
    EXPECT_EQ(TakeSystemLogTexts(),
              (Lines{"Fail to send notification: QUORSYSLOG_VOL_FULL", "Fail to send notification"}));
}

}  // namespace
