#include <gtest/gtest.h>

#include <functional>

#include "common/paths.h"
#include "notification.h"
#include "support/notices.h"
#include "support/system_log.h"

namespace {

using quor::test::FakeNotices;
using quor::test::TakeSystemLogTexts;
using Lines = std::vector<std::string>;

struct Sender {
    std::string tag;
    std::map<std::string, std::string> values;
    std::function<int(NotificationManager&, const std::string& text)> send;
};

constexpr char kText[] = "a\"b\\c\n%HOST%";
constexpr char kEscaped[] = "a\\\"b\\\\c\n%HOST%";

_SYSLOG_LOG_DATA_tag logOf(const std::string& text) {
    _SYSLOG_LOG_DATA_tag log;
    log.msg = text;
    return log;
}

// Every sender, the first two carrying the content of a log; what stands beside it is never escaped.
const std::pair<std::string, std::string> kClass{"DESKTOP_NOTIFY_CLASSNAME", "QUOR.KVX.Orvane.Instance"};
const std::vector<Sender> kManager{
    {"QUORSYSLOG_SEV_EXCEED",
     {kClass, {"%HOST%", "h\""}, {"%SEV%", "err"}, {"%SYSLOG_CONTENT%", kEscaped}},
     [](NotificationManager& manager, const std::string& text) {
         _SYSLOG_LOG_DATA_tag log = logOf(text);
         return manager.NotificationSendSev("h\"", SYSLOG_PRIORITY_ERR, log);
     }},
    {"QUORSYSLOG_KEYWORD_MATCH",
     {kClass, {"%HOST%", "h"}, {"%KEYWORD%", "k\""}, {"%SYSLOG_CONTENT%", kEscaped}},
     [](NotificationManager& manager, const std::string& text) {
         _SYSLOG_LOG_DATA_tag log = logOf(text);
         return manager.NotificationSendKeyword("h", "k\"", log);
     }},
    {"QUORSYSLOG_EPS_EXCEED",
     {kClass, {"%EPS%", "18446744073709551615"}},
     [](NotificationManager& manager, const std::string&) { return manager.NotificationSendEps(UINT64_MAX); }},
    {"QUORSYSLOG_VOL_FULL",
     {kClass, {"%SHARED_FOLDER%", kText}},
     [](NotificationManager& manager, const std::string& text) { return manager.NotificationSendVolFull(text); }},
};

template <int (*Send)(const char*)>
int share(NotificationManager&, const std::string& text) {
    return Send(nullptr) == -1 ? Send(text.c_str()) : 1;
}

template <int (*Send)(const char*, const char*)>
int content(NotificationManager&, const std::string& text) {
    return Send(nullptr, "x") == -1 && Send("x", nullptr) == -1 ? Send("m\"", text.c_str()) : 1;
}

const std::vector<Sender> kMail{
    {"QUORSYSLOG_SEV_EXCEED", {{"%SEV%", "m\""}, {"%SYSLOG_CONTENT%", kEscaped}}, content<SyslogMailSeverityExceeded>},
    {"QUORSYSLOG_KEYWORD_MATCH",
     {{"%KEYWORD%", "m\""}, {"%SYSLOG_CONTENT%", kEscaped}},
     content<SyslogMailKeywordMatched>},
    {"QUORSYSLOG_ShareRemove", {{"%SHARED_FOLDER%", kText}}, share<SyslogMailShareRemove>},
    {"QUORSYSLOG_ShareRename", {{"%SHARED_FOLDER%", kText}}, share<SyslogMailShareRename>},
    {"QUORSYSLOG_ShareEncMount", {{"%SHARED_FOLDER%", kText}}, share<SyslogMailShareEncMount>},
    {"QUORSYSLOG_ShareEncUnmount", {{"%SHARED_FOLDER%", kText}}, share<SyslogMailShareEncUnmount>},
};

class Senders : public testing::Test {
  protected:
    Senders() { TakeSystemLogTexts(); }

    // The result, with "sent" or not, and the lines in the system log.
    Lines outcome(const Sender& sender, const std::string& text, bool fail = false) {
        FakeNotices() = {};
        FakeNotices().fail = fail;
        const int result = sender.send(manager_, text);
        Lines told{std::to_string(result) + (FakeNotices().sent.empty() ? "" : " sent")};
        const Lines logged = TakeSystemLogTexts();
        told.insert(told.end(), logged.begin(), logged.end());
        return told;
    }

    NotificationManager manager_;
};

TEST_F(Senders, FillThePlaceholdersOfTheirTemplate) {
    for (const auto* senders : {&kManager, &kMail}) {
        for (const Sender& sender : *senders) {
            EXPECT_EQ(outcome(sender, kText), Lines{"0 sent"}) << sender.tag;
            const quor::test::Notice& sent = FakeNotices().sent.back();
            EXPECT_EQ(sent.tag, sender.tag);
            EXPECT_EQ(sent.values, sender.values) << sender.tag;
            EXPECT_EQ(sent.textsDir + sent.filterFile,
                      std::string(quor::paths::kNotifyTexts) + quor::paths::kNotifyFilter);
        }
    }
}

TEST_F(Senders, ReportFailures) {
    for (const Sender& sender : kManager) {
        EXPECT_EQ(outcome(sender, "x", true),
                  (Lines{"-1 sent", "Fail to send notification: " + sender.tag, "Fail to send notification"}));
    }
    for (const Sender& sender : kMail) {
        EXPECT_EQ(outcome(sender, "x", true), (Lines{"-1 sent", "Fail to send notification: " + sender.tag}));
    }
}

TEST_F(Senders, GuardAndBoundLogContent) {
    const Lines tooMuch{"-1", "Not enough memory"};
    const struct {
        std::string text;
        Lines manager;
        Lines mail;
    } cases[] = {
        {"x Failed to send email. y", {"0"}, {"0 sent"}},
        {"Failed to send email." + std::string(4096, 'x'), {"0"}, {"-1"}},
        {"failed to send email.", {"0 sent"}, {"0 sent"}},
        {std::string(2047, 'x'), {"0 sent"}, {"0 sent"}},
        {std::string(2048, 'x'), tooMuch, {"-1"}},
        {std::string(1023, '"') + "x", {"0 sent"}, {"0 sent"}},
        {std::string(1024, '\\'), tooMuch, {"-1"}},
    };
    for (const auto& row : cases) {
        for (const size_t i : {0U, 1U}) {
            EXPECT_EQ(outcome(kManager[i], row.text), row.manager) << row.text;
            EXPECT_EQ(outcome(kMail[i], row.text), row.mail) << row.text;
        }
    }
}

}  // namespace
