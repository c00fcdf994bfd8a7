#include "notification.h"
#include "support/notices.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

using Values = std::map<std::string, std::string>;

class Senders : public testing::Test {
  protected:
    Senders() {
        FakeNotices() = {};
        TakeSystemLog();
    }

    NotificationManager manager_;
};

TEST_F(Senders, FillThePlaceholdersOfTheirTemplates) {
    _SYSLOG_LOG_DATA_tag log;
    log.msg = "a\"b\\c\n%HOST%";
    int failures = manager_.NotificationSendSev("h\"", SYSLOG_PRIORITY_ERR, log);
    failures += manager_.NotificationSendKeyword("h", "k\"", log);
    failures += manager_.NotificationSendEps(UINT64_MAX);
    failures += manager_.NotificationSendVolFull("s\"");
    failures += SyslogMailSeverityExceeded("m\"", log.msg.c_str()) + SyslogMailKeywordMatched("m", log.msg.c_str());
    failures += SyslogMailShareRemove("1") + SyslogMailShareRename("2");
    failures += SyslogMailShareEncMount("3") + SyslogMailShareEncUnmount("4");
    EXPECT_EQ(failures, 0);

    const std::pair<const std::string, std::string> escaped{"%SYSLOG_CONTENT%", "a\\\"b\\\\c\n%HOST%"};
    const std::pair<const std::string, std::string> desktop{"DESKTOP_NOTIFY_CLASSNAME", "QUOR.KVX.Orvane.Instance"};
    const std::vector<std::pair<std::string, Values>> wanted{
        {"QUORSYSLOG_SEV_EXCEED", {desktop, {"%HOST%", "h\""}, {"%SEV%", "err"}, escaped}},
        {"QUORSYSLOG_KEYWORD_MATCH", {desktop, {"%HOST%", "h"}, {"%KEYWORD%", "k\""}, escaped}},
        {"QUORSYSLOG_EPS_EXCEED", {desktop, {"%EPS%", "18446744073709551615"}}},
        {"QUORSYSLOG_VOL_FULL", {desktop, {"%SHARED_FOLDER%", "s\""}}},
        {"QUORSYSLOG_SEV_EXCEED", {{"%SEV%", "m\""}, escaped}},
        {"QUORSYSLOG_KEYWORD_MATCH", {{"%KEYWORD%", "m"}, escaped}},
        {"QUORSYSLOG_ShareRemove", {{"%SHARED_FOLDER%", "1"}}},
        {"QUORSYSLOG_ShareRename", {{"%SHARED_FOLDER%", "2"}}},
        {"QUORSYSLOG_ShareEncMount", {{"%SHARED_FOLDER%", "3"}}},
        {"QUORSYSLOG_ShareEncUnmount", {{"%SHARED_FOLDER%", "4"}}},
    };
    std::vector<std::pair<std::string, Values>> sent;
    for (const Notice& notice : FakeNotices().sent) {
        sent.emplace_back(notice.tag, notice.values);
        EXPECT_EQ(notice.textsDir, quor::paths::kNotifyTexts);
        EXPECT_EQ(notice.filterFile, quor::paths::kNotifyFilter);
    }
    EXPECT_EQ(sent, wanted);
}

TEST_F(Senders, ReportAFailedSendAndRefuseNull) {
    FakeNotices().fail = true;
    EXPECT_EQ(manager_.NotificationSendVolFull("s"), -1);
    EXPECT_EQ(SyslogMailShareRename("s"), -1);
    EXPECT_EQ(TakeSystemLogTexts(),
              (Strings{"Fail to send notification: QUORSYSLOG_VOL_FULL", "Fail to send notification",
                       "Fail to send notification: QUORSYSLOG_ShareRename"}));
    FakeNotices() = {};
    EXPECT_EQ(SyslogMailShareRename(nullptr), -1);
    EXPECT_EQ(SyslogMailSeverityExceeded(nullptr, "x"), -1);
    EXPECT_EQ(SyslogMailKeywordMatched("k", nullptr), -1);
    EXPECT_TRUE(FakeNotices().sent.empty());
}

TEST_F(Senders, GuardAndBoundLogContent) {
    const std::tuple<std::string, size_t, int, int> cases[] = {
        {"x Failed to send email. y", 0, 0, 0}, {"Failed to send email." + std::string(4096, 'x'), 0, 0, -1},
        {"failed to send email.", 1, 0, 0},     {std::string(2047, 'x'), 1, 0, 0},
        {std::string(2048, 'x'), 0, -1, -1},    {std::string(1023, '"') + "x", 1, 0, 0},
        {std::string(1024, '\\'), 0, -1, -1},
    };
    for (const auto& [text, sent, manager, mail] : cases) {
        FakeNotices() = {};
        EXPECT_EQ(manager_.NotificationSendSev("h", std::string("err"), text), manager) << text;
        EXPECT_EQ(manager_.NotificationSendKeyword("h", "k", text), manager);
        EXPECT_EQ(FakeNotices().sent.size(), 2 * sent) << text;
        EXPECT_EQ(TakeSystemLogTexts(), Strings(manager < 0 ? 2 : 0, "Not enough memory"));
        EXPECT_EQ(SyslogMailSeverityExceeded("err", text.c_str()), mail) << text;
        EXPECT_EQ(SyslogMailKeywordMatched("k", text.c_str()), mail);
    }
}

}  // namespace
