#include <gtest/gtest.h>

#include "notification.h"
#include "support/notices.h"
#include "support/system_log.h"

namespace {

using quor::test::FakeNotices;
using Values = std::map<std::string, std::string>;

class Mail : public testing::Test {
  protected:
    Mail() {
        FakeNotices() = {};
        quor::test::TakeSystemLog();
    }
};

TEST_F(Mail, ShareNoticesCarryTheShareAlone) {
    const struct {
        int (*send)(const char*);
        std::string tag;
    } cases[] = {
        {SyslogMailShareRemove, "QUORSYSLOG_ShareRemove"},
        {SyslogMailShareRename, "QUORSYSLOG_ShareRename"},
        {SyslogMailShareEncMount, "QUORSYSLOG_ShareEncMount"},
        {SyslogMailShareEncUnmount, "QUORSYSLOG_ShareEncUnmount"},
    };
    for (const auto& row : cases) {
        FakeNotices() = {};
        EXPECT_EQ(row.send("a \"share\""), 0);
        EXPECT_EQ(row.send(nullptr), -1);
        ASSERT_EQ(FakeNotices().sent.size(), 1U) << row.tag;
        EXPECT_EQ(FakeNotices().sent[0].tag, row.tag);
        EXPECT_EQ(FakeNotices().sent[0].values, (Values{{"%SHARED_FOLDER%", "a \"share\""}}));
        FakeNotices().fail = true;
        EXPECT_EQ(row.send("s"), -1);
        EXPECT_EQ(quor::test::TakeSystemLogTexts(), std::vector{"Fail to send notification: " + row.tag});
    }
}

TEST_F(Mail, LogNoticesEscapeWithinTheBuffer) {
    const struct {
        int (*send)(const char*, const char*);
        const char* tag;
        const char* placeholder;
    } cases[] = {{SyslogMailSeverityExceeded, "QUORSYSLOG_SEV_EXCEED", "%SEV%"},
                 {SyslogMailKeywordMatched, "QUORSYSLOG_KEYWORD_MATCH", "%KEYWORD%"}};
    for (const auto& row : cases) {
        FakeNotices() = {};
        EXPECT_EQ(row.send("m", "Failed to send email. \"\\\t"), 0) << "nothing is dropped here";
        EXPECT_EQ(row.send("m", std::string(2047, 'x').c_str()), 0);
        EXPECT_EQ(row.send("m", std::string(2048, 'x').c_str()), -1);
        EXPECT_EQ(row.send(nullptr, "x"), -1);
        EXPECT_EQ(row.send("m", nullptr), -1);
        ASSERT_EQ(FakeNotices().sent.size(), 2U);
        EXPECT_EQ(FakeNotices().sent[0].tag, row.tag);
        EXPECT_EQ(FakeNotices().sent[0].values,
                  (Values{{row.placeholder, "m"}, {"%SYSLOG_CONTENT%", "Failed to send email. \\\"\\\\\t"}}));
        EXPECT_TRUE(quor::test::TakeSystemLog().empty());
    }
}

}  // namespace
