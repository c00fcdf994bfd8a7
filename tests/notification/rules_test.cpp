#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <tuple>

#include "common/numbers.h"
#include "common/paths.h"
#include "notification.h"
#include "support/notices.h"
#include "support/system_log.h"
#include "support/temp_folder.h"

namespace {

using Lines = std::vector<std::string>;

_SYSLOG_NOTIFY_RULES_tag rule(const std::string& name, int64_t eps, const std::string& pattern, bool enable) {
    _SYSLOG_NOTIFY_RULES_tag made;
    made.name = name;
    made.notify_type = 2;
    made.notify_pri = SYSLOG_PRIORITY_WARNING;
    made.notify_eps = eps;
    made.notify_pat = pattern;
    made.notify_enable = enable;
    return made;
}

TEST(NotifyConf, ReadsBackWhatItWrote) {
    const quor::test::TempFolder folder;
    const std::string file = folder.path("notify.conf");
    for (_SYSLOG_NOTIFY_RULES_tag wanted :
         {rule("a rule", 0, "", true), rule("b", INT64_MAX, R"(di"sk\ [x]=#;)", false),
          rule("a rule", 7, " % ", false)}) {
        ASSERT_EQ(SyslogNotifyConfSet(file, "not used", wanted), 0);
        _SYSLOG_NOTIFY_RULES_tag found;
        ASSERT_EQ(SyslogNotifyConfGet(file, wanted.name, found), 0);
        EXPECT_EQ(std::tie(found.name, found.notify_type, found.notify_pri, found.notify_eps, found.notify_pat,
                           found.notify_enable),
                  std::tie(wanted.name, wanted.notify_type, wanted.notify_pri, wanted.notify_eps, wanted.notify_pat,
                           wanted.notify_enable));
    }
}

TEST(NotifyConf, WritesNegativeNumbersUnsigned) {
    const quor::test::TempFolder folder;
    const std::string file = folder.path("notify.conf");
    _SYSLOG_NOTIFY_RULES_tag negative = rule("r", -1, "p", true);
    negative.notify_type = -2;
    ASSERT_EQ(SyslogNotifyConfSet(file, "r", negative), 0);
    EXPECT_EQ(quor::test::ReadFile(file), "[r]\nnotify_type=\"18446744073709551614\"\n"
                                          "notify_eps=\"18446744073709551615\"\nnotify_pri=\"4\"\nnotify_pat=\"p\"\n"
                                          "notify_enable=\"1\"\n");
}

TEST(NotifyConf, ReportsWhatItCannotWrite) {
    const quor::test::TempFolder folder;
    const std::string file = folder.write("notify.conf", "[r]\n");
    quor::test::TakeSystemLog();
    for (_SYSLOG_NOTIFY_RULES_tag bad : {rule("r", 0, "a\n[evil]", true), rule("r", 0, std::string("a\0b", 3), true),
                                         rule("", 0, "a", true), rule(std::string("r\0s", 3), 0, "a", true)}) {
        EXPECT_EQ(SyslogNotifyConfSet(file, "r", bad), -1);
        EXPECT_EQ(quor::test::TakeSystemLogTexts(), Lines{"utils:139 Fail set section to file"});
    }
    EXPECT_EQ(quor::test::ReadFile(file), "[r]\n");
}

TEST(NotifyConf, TakesOddValuesButNoMissingKey) {
    const quor::test::TempFolder folder;
    const Lines keys = {"notify_type=x\n", "notify_eps=-5\n", "notify_pri=99999999999\n", "notify_pat=\n",
                        "notify_enable=\" 1\"\n"};
    for (size_t missing = 0; missing <= keys.size(); ++missing) {
        std::string text = "[r]\n";
        for (size_t key = 0; key < keys.size(); ++key) {
            text += key == missing ? "" : keys[key];
        }
        const bool complete = missing == keys.size();
        _SYSLOG_NOTIFY_RULES_tag found = rule("before", 9, "before", true);
        EXPECT_EQ(SyslogNotifyConfGet(folder.write("notify.conf", text), "r", found), complete ? 0 : -1) << text;
        EXPECT_EQ(found.name, complete ? "r" : "before");
        EXPECT_EQ(found.notify_type, complete ? 0 : 2);
        EXPECT_EQ(static_cast<int32_t>(found.notify_pri), complete ? INT32_MAX : 4);
        EXPECT_EQ(found.notify_eps, complete ? -5 : 9);
        EXPECT_EQ(found.notify_enable, !complete);
        EXPECT_EQ(quor::test::TakeSystemLogTexts(),
                  complete ? Lines{} : Lines{"utils:85 Fail to do QLIBCFileGetSection"});
    }
}

TEST(IsNotificationSet, AsksEveryChannelUntilOneCannotBeRead) {
    const std::string all = "smtp_mail_enabled=\"yes\"\npushservice_mobile_enabled=\"no\"\n"
                            "pushservice_msn_enabled=\"no\"\npushservice_skype_enabled=\"";
    const struct {
        const char* name;
        std::string settings;
        const char* recipient;
        int sms;
        bool set;
        const char* message;
    } cases[] = {
        {"nothing", all + "no", "", 0, false, ""},
        {"mail", all + "no", "a@b", 0, true, ""},
        {"sms", all + "no", "", 1, true, ""},
        {"skype", all + "yes", "", 0, true, ""},
        {"not a yes", all + "yes, please", "", 0, false, ""},
        {"no file", "", "a@b", 1, false, "utils:166 Fail to get smtp mail setting"},
        {"mail off", "smtp_mail_enabled=\"no", "a@b", 1, false, "utils:188 Fail to get mobile setting"},
        {"mail on", "smtp_mail_enabled=\"yes", "a@b", 1, true, "utils:188 Fail to get mobile setting"},
        {"no mail settings", all + "yes", nullptr, 1, false, "utils:161 Fail to get mail setting"},
        {"no sms settings", all + "yes", "", -1, false, "utils:178 Fail to get sms setting"},
    };
    const std::filesystem::path file = quor::paths::kSystemSettings;
    std::filesystem::create_directories(file.parent_path());
    quor::test::Notices& service = quor::test::FakeNotices();
    for (const auto& row : cases) {
        std::ofstream(file) << row.settings << "\"\n";
        service = {};
        std::string("mail").copy(service.mail.server, sizeof service.mail.server - 1);
        std::string(quor::OrEmpty(row.recipient)).copy(service.mail.recipient, sizeof service.mail.recipient - 1);
        service.mailUnreadable = row.recipient == nullptr;
        service.sms.enabled = row.sms;
        service.smsUnreadable = row.sms < 0;
        EXPECT_EQ(IsNotificationSet(), row.set) << row.name;
        EXPECT_EQ(quor::test::TakeSystemLogTexts(), *row.message ? Lines{row.message} : Lines{}) << row.name;
        EXPECT_EQ(service.smsLent, 0) << row.name;
    }
    std::filesystem::remove(file);
}

}  // namespace
