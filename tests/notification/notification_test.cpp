#include <functional>
#include <sstream>
#include <tuple>

#include "base/numbers.h"
#include "notification.h"
#include "tests/support/notices.h"
#include "tests/support/testing.h"

using namespace quor::test;

namespace {

_SYSLOG_NOTIFY_RULES_tag rule(const std::string& name, int type, int pri, int64_t eps, const std::string& pattern,
                              bool enable = true) {
    return {name, type, static_cast<_SYSLOG_DB_PRIORITY_tag>(pri), eps, pattern, enable};
}

auto fields(const _SYSLOG_NOTIFY_RULES_tag& r) {
    return std::tie(r.name, r.notify_type, r.notify_pri, r.notify_eps, r.notify_pat, r.notify_enable);
}

class Rules : public testing::Test {
  protected:
    // The package's own rule file is not there.
    static NotificationManager withoutRules() {
        std::filesystem::remove(quor::paths::kNotifyRules);
        TakeSystemLogTexts();
        return {};
    }

    void load(std::initializer_list<_SYSLOG_NOTIFY_RULES_tag> rules) {
        for (_SYSLOG_NOTIFY_RULES_tag each : rules) {
            ASSERT_EQ(SyslogNotifyConfSet(file_, "not used", each), 0);
        }
        TakeSystemLogTexts();
        ASSERT_EQ(manager_.ConfigLoad(file_), 0);
    }

    const TempFolder folder_;
    const std::string file_ = folder_.path("notify.conf");
    NotificationManager manager_ = withoutRules();
};

TEST_F(Rules, AreWrittenWholeOrReported) {
    folder_.write("notify.conf", "");
    _SYSLOG_NOTIFY_RULES_tag negative = rule("r", -2, 4, -1, "p");
    ASSERT_EQ(SyslogNotifyConfSet(file_, "r", negative), 0);
    for (_SYSLOG_NOTIFY_RULES_tag bad :
         {rule("r", 0, 0, 0, "a\n[evil]"), rule("r", 0, 0, 0, std::string("a\0b", 3)), rule("", 0, 0, 0, "a")}) {
        EXPECT_EQ(Said(SyslogNotifyConfSet(file_, "r", bad)), "-1 utils:139 Fail set section to file");
    }
    EXPECT_EQ(ReadFile(file_),
              "[r]\nnotify_type=\"18446744073709551614\"\nnotify_eps=\"18446744073709551615\"\nnotify_pri=\"4\"\n"
              "notify_pat=\"p\"\nnotify_enable=\"1\"\n");
}

TEST_F(Rules, OddValuesReadButAMissingKeyFails) {
    const std::string text = "[r]\nnotify_type=x\nnotify_eps=-5\nnotify_pri=99999999999\nnotify_pat=\n";
    _SYSLOG_NOTIFY_RULES_tag found = rule("before", 2, 4, 9, "before");
    const _SYSLOG_NOTIFY_RULES_tag before = found;
    EXPECT_EQ(Said(SyslogNotifyConfGet(folder_.write("notify.conf", text), "r", found)),
              "-1 utils:85 Fail to do QLIBCFileGetSection");
    EXPECT_EQ(fields(found), fields(before));
    EXPECT_EQ(SyslogNotifyConfGet(folder_.write("notify.conf", text + "notify_enable=\" 1\"\n"), "r", found), 0);
    EXPECT_EQ(fields(found), fields(rule("r", 0, INT32_MAX, -5, "", false)));
}

TEST_F(Rules, LoadingStopsAtABadSection) {
    EXPECT_EQ(TakeSystemLogTexts(), (Strings{"Fail to do QLIBCFileEnumSection", "Fail to load configuration"}));
    const std::string good = "notify_type=1\nnotify_pri=0\nnotify_pat=\nnotify_enable=1\nnotify_eps=";
    folder_.write("notify.conf", "[a]\n" + good + "100\n[bad]\nnotify_type=1\n[b]\n" + good + "10\n");
    EXPECT_EQ(manager_.ConfigLoad(file_), 0);
    EXPECT_EQ(TakeSystemLogTexts(),
              (Strings{"utils:85 Fail to do QLIBCFileGetSection", "Fail to get notification setting bad"}));
    EXPECT_TRUE(manager_.CheckEps(100));
    EXPECT_FALSE(manager_.CheckEps(99));
}

TEST_F(Rules, OnlyEnabledOnesOfTheKindCountInFileOrder) {
    load({rule("off", 1, 7, 0, "x", false), rule("other", 3, 7, 0, "x"), rule("e", 1, 7, INT64_MAX, "x"),
          rule("s", 0, 3, 0, "x"), rule("empty", 2, 0, 0, ""), rule("no", 2, 0, 0, "volume", false),
          rule("long", 2, 0, 0, "disk full"), rule("short", 2, 0, 0, "disk")});
    EXPECT_TRUE(manager_.CheckEps(1ULL << 63U)) << "compared unsigned";
    EXPECT_TRUE(manager_.CheckSev(SYSLOG_PRIORITY_ERR));
    EXPECT_FALSE(manager_.CheckSev(SYSLOG_PRIORITY_WARNING));
    EXPECT_EQ(manager_.CheckKeyword("disk full on volume"), "disk full");
    EXPECT_EQ(manager_.CheckKeyword(std::string("\0a disk", 7)), "disk");
}

TEST(IsNotificationSet, AsksEveryChannelUntilOneCannotBeRead) {
    // The switches of mail, mobile, msn and skype as far as they are there. The recipient is null when the mail
    // settings cannot be read, the SMS setting negative when those cannot be. The answer and the message.
    const std::tuple<std::string, const char*, int, std::string> cases[] = {
        {"yes no no no", "a@b", 0, "1 "},
        {"yes no no no", "", 0, "0 "},
        {"yes no no no", "a", 0, "1 "},
        {"yes,please no no no", "a@b", 0, "0 "},
        {"no yes no no", "a@b", 0, "1 "},
        {"no no yes no", "a@b", 0, "1 "},
        {"no no no yes", "a@b", 0, "1 "},
        {"no no no no", "a@b", 1, "1 "},
        {"no no no no", "a@b", 0, "0 "},
        {"", "a@b", 1, "0 utils:166 Fail to get smtp mail setting"},
        {"yes", "a@b", 1, "1 utils:188 Fail to get mobile setting"},
        {"no yes", "a@b", 1, "0 utils:196 Fail to get msn setting"},
        {"no yes yes", "a@b", 1, "0 utils:204 Fail to get skype setting"},
        {"yes yes yes yes", nullptr, 1, "0 utils:161 Fail to get mail setting"},
        {"no yes yes yes", "a@b", -1, "0 utils:178 Fail to get sms setting"}};
    Notices& service = FakeNotices();
    for (const auto& [switches, recipient, sms, answer] : cases) {
        std::istringstream words(switches);
        std::string settings;
        for (const char* key : {"smtp_mail", "pushservice_mobile", "pushservice_msn", "pushservice_skype"}) {
            std::string word;
            settings += words >> word ? key + ("_enabled=" + word) + "\n" : "";
        }
        WriteFile(quor::paths::kSystemSettings, settings);
        service = {};
        std::string("mail").copy(service.mail.server, sizeof service.mail.server - 1);
        std::string(quor::OrEmpty(recipient)).copy(service.mail.recipient, sizeof service.mail.recipient - 1);
        service.mailUnreadable = recipient == nullptr;
        service.sms.enabled = sms;
        service.smsUnreadable = sms < 0;
        TakeSystemLog();
        EXPECT_EQ(Said(IsNotificationSet()), answer) << settings;
        EXPECT_EQ(service.smsLent, 0) << settings;
    }
    std::filesystem::remove(quor::paths::kSystemSettings);
}

class Senders : public testing::Test {
  protected:
    Senders() {
        FakeNotices() = {};
        TakeSystemLog();
    }

    NotificationManager manager_;
};

TEST_F(Senders, FillThePlaceholdersAndReportWhatFails) {
    _SYSLOG_LOG_DATA_tag log;
    log.msg = "a\"b\\c\n%HOST%";
    const char* const text = log.msg.c_str();
    const std::string desktop = "DESKTOP_NOTIFY_CLASSNAME=QUOR.KVX.Orvane.Instance ";
    const std::string content = "%SYSLOG_CONTENT%=a\\\"b\\\\c\n%HOST% ";
    const std::tuple<std::function<int()>, std::string, std::string> cases[] = {
        {[&] { return manager_.NotificationSendSev("h\"", SYSLOG_PRIORITY_ERR, log); }, "QUORSYSLOG_SEV_EXCEED",
         "%HOST%=h\" %SEV%=err " + content + desktop},
        {[&] { return manager_.NotificationSendKeyword("h", "k\"", log); }, "QUORSYSLOG_KEYWORD_MATCH",
         "%HOST%=h %KEYWORD%=k\" " + content + desktop},
        {[&] { return manager_.NotificationSendEps(UINT64_MAX); }, "QUORSYSLOG_EPS_EXCEED",
         "%EPS%=18446744073709551615 " + desktop},
        {[&] { return manager_.NotificationSendVolFull("s\""); }, "QUORSYSLOG_VOL_FULL",
         "%SHARED_FOLDER%=s\" " + desktop},
        {[&] { return SyslogMailKeywordMatched("m\"", text); }, "QUORSYSLOG_KEYWORD_MATCH", "%KEYWORD%=m\" " + content},
        {[&] { return SyslogMailSeverityExceeded("e", text); }, "QUORSYSLOG_SEV_EXCEED", "%SEV%=e " + content},
        {[] { return SyslogMailShareRemove("1"); }, "QUORSYSLOG_ShareRemove", "%SHARED_FOLDER%=1 "},
        {[] { return SyslogMailShareRename("2"); }, "QUORSYSLOG_ShareRename", "%SHARED_FOLDER%=2 "},
        {[] { return SyslogMailShareEncMount("3"); }, "QUORSYSLOG_ShareEncMount", "%SHARED_FOLDER%=3 "},
        {[] { return SyslogMailShareEncUnmount("4"); }, "QUORSYSLOG_ShareEncUnmount", "%SHARED_FOLDER%=4 "},
    };
    for (const auto& [send, tag, values] : cases) {
        const bool managed = values.find(desktop) != std::string::npos;
        FakeNotices() = {};
        EXPECT_EQ(Said(send()), "0 ");
        ASSERT_EQ(FakeNotices().sent.size(), 1U);
        const Notice notice = FakeNotices().sent[0];
        std::string sent = notice.tag + " ";
        for (const auto& [key, value] : notice.values) {
            sent.append(key).append("=").append(value).append(" ");
        }
        EXPECT_EQ(sent, std::string(tag).append(" ").append(values));
        EXPECT_EQ(notice.textsDir, quor::paths::kNotifyTexts);
        EXPECT_EQ(notice.filterFile, quor::paths::kNotifyFilter);
        FakeNotices().fail = true;
        EXPECT_EQ(send(), -1);
        const std::string failed = "Fail to send notification: " + tag;
        EXPECT_EQ(TakeSystemLogTexts(), managed ? Strings({failed, "Fail to send notification"}) : Strings{failed});
    }
}

TEST_F(Senders, RefuseNull) {
    QLIBSZHASH* table = nullptr;
    char tag[] = "tag";
    for (const int result :
         {manager_.NotificationSend(nullptr, &table), manager_.NotificationSend(tag, nullptr),
          SyslogMailSend(nullptr, &table), SyslogMailSend(tag, nullptr), SyslogMailShareRename(nullptr),
          SyslogMailSeverityExceeded(nullptr, ""), SyslogMailKeywordMatched("", nullptr)}) {
        EXPECT_EQ(result, -1);
    }
    EXPECT_TRUE(FakeNotices().sent.empty());
}

TEST_F(Senders, GuardAndBoundLogContent) {
    const std::tuple<std::string, size_t, int, int> cases[] = {
        {"x Failed to send email. y", 0, 0, 0}, {"Failed to send email." + std::string(4096, 'x'), 0, 0, -1},
        {"failed to send email.", 1, 0, 0},     {std::string(1023, '"') + "x", 1, 0, 0},
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
