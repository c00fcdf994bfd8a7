#include <json/reader.h>
#include <json/value.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include "platform/notify/settings.h"
#include "tests/notify/fixture.h"

namespace quor::test {
namespace {

constexpr const char kDesktopOn[] = "desktop_notify_enabled=\"yes\"\n";
const std::string kSpool = paths::kNotifySpool;

// Notices as they arrive on the desktop.
class Notices : public Notify {
  protected:
    Notices() { settings(kDesktopOn); }

    static std::vector<Json::Value> arrived(size_t count) {
        std::vector<Json::Value> notices;
        for (const std::string& line : awaitLines(kSpool + "/desktop.jsonl", count)) {
            Json::Reader reader(Json::Features::strictMode());
            EXPECT_TRUE(reader.parse(line, notices.emplace_back())) << line;
        }
        EXPECT_EQ(notices.size(), count);
        return notices;
    }

    // Sends one notice and waits for it: workers side by side may change the order.
    Json::Value sent(const Values& values, const std::string& tag = "T") {
        EXPECT_EQ(send(values, tag), 0);
        return arrived(++sent_).back();
    }

  private:
    size_t sent_ = 0;
};

TEST_F(Notices, ShowValuesAsTheyWereReceived) {
    // The first and last characters of each length, and what lies just beyond.
    const std::string utf8 = "\xF4\x8F\xBF\xBF \xED\x9F\xBF \xEE\x80\x80 \xC2\x80 \xE0\xA0\x80 \xF0\x90\x80\x80";
    const std::string other = "\xF4\x90\x80\x80 \xED\xBF\xBF \xC1\xBF \xE0\x9F\xBF \xF0\x8F\xBF\xBF \xE2\x82";
    const std::string shown = R"(\xf4\x90\x80\x80 \xed\xbf\xbf \xc1\xbf \xe0\x9f\xbf \xf0\x8f\xbf\xbf \xe2\x82)";
    const std::tuple<const char*, Values, const char*, std::string> cases[]{
        // template, values, subject, body
        {"%A% of %\n\n100%%A%% %B\n", {{"%A%", "x"}}, "x of %", "100%x% %B\n"},
        {"S\r\n\r\nHost: %HOST%\r\nEnd", {}, "S", "End\n"},
        {"%A%\n\n%A%\n", {{"%A%", "%HOST%"}, {"%HOST%", "h"}}, "%HOST%", "%HOST%\n"},
        {"S\n\n%SYSLOG_CONTENT%|%A%\n", {{"%SYSLOG_CONTENT%", R"(\"\\n\x)"}, {"%A%", R"(\")"}}, "S", "\"\\n\\x|\\\"\n"},
        {"%A%\n\n%A%\n", {{"%A%", "a\r\nBcc: x\x1b[31m\x7f"}}, "a  Bcc: x [31m ", "a\r\nBcc: x\x1b[31m\x7f\n"},
        {"S\n\n%A%\n", {{"%A%", utf8}}, "S", utf8 + "\n"},
        {"S\n\n%A%\n", {{"%A%", other}}, "S", shown + "\n"},
        {"%A%\n\n%A%\n", {{"%A%", "\xE9z"}}, "\xEF\xBF\xBDz", "\\xe9z\n"}};
    Json::Value notice;
    for (const auto& [text, values, subject, body] : cases) {
        folder_.write("T.txt", text);
        notice = sent(values);
        EXPECT_EQ(notice["subject"].asString(), subject) << text;
        EXPECT_EQ(notice["body"].asString(), body) << text;
    }
    EXPECT_EQ(notice["bodyBase64"].asString(), "6XoK");
    notice = sent({{"%A%", std::string(70000, 'x')}});
    EXPECT_EQ(notice["subject"].asString().size(), 240U);
    EXPECT_EQ(notice["body"].asString(), std::string(65536, 'x') + "\n");
}

TEST_F(Notices, FailWithoutATemplateThatHasASubject) {
    folder_.write("BLANK.txt", " \n\nbody\n");
    for (const char* tag : {"BLANK", "MISSING", "", "./T"}) {
        EXPECT_LT(send({}, tag), 0) << tag;
    }
    settings("");
    EXPECT_EQ(send({}), 0);
    EXPECT_FALSE(std::filesystem::exists(kSpool)) << "no channel, nothing to do";
    settings(kDesktopOn);
    WriteFile(kSpool + "/ledger", "");
    const Descriptor ledger(open((kSpool + "/ledger").c_str(), O_RDWR | O_CLOEXEC));
    ASSERT_EQ(flock(ledger.get(), LOCK_EX), 0);
    EXPECT_LT(send({}), 0) << "somebody holds the spool";
}

TEST_F(Notices, TheShippedFilesServeEveryTag) {
    texts_ = SOURCE_FOLDER "/texts";
    filter_ = SOURCE_FOLDER "/etc/notify.filter";
    settings(ReadFile(SOURCE_FOLDER "/etc/quorinfo.conf.example"));
    Values values{{"DESKTOP_NOTIFY_CLASSNAME", "App"}};
    for (const char* key : {"%EPS%", "%SYSLOG_CONTENT%", "%SHARED_FOLDER%", "%DBPATH%"}) {
        values[key] = "<value>";
    }
    for (const char* name : {"EPS_EXCEED", "SEV_EXCEED", "KEYWORD_MATCH", "VOL_FULL", "DB_CORRUPT", "ShareRemove",
                             "ShareRename", "ShareEncMount", "ShareEncUnmount"}) {
        const Json::Value notice = sent(values, std::string("QUORSYSLOG_") + name);
        const std::string body = notice["body"].asString();
        EXPECT_EQ(notice["class"].asString(), "App");
        EXPECT_TRUE(body.find("<value>") != std::string::npos && body.find("Host") == std::string::npos) << name;
    }
}

TEST_F(Notices, KeepTheIntervalOfTheirTagAndHost) {
    filter_ = folder_.write("filter", "[T]\ninterval=\"60\"\n[M]\nchannels=\"mail\"\n");
    folder_.write("M.txt", "Subject\n");
    const std::string hostile = "\n../\x1b" + std::string(300, 'x');
    // The time, the host and what is counted as suppressed in the notice that arrives; -1 when none does.
    const std::vector<std::tuple<time_t, std::string, int>> steps{
        {1000, "a", 0},      {1059, "a", -1}, {1059, "b", 0},  {1059, "", 0}, {1001, hostile, 0},
        {1002, hostile, -1}, {1060, "a", 1},  {1061, "a", -1}, {500, "a", 1} /* the clock was set back */};
    for (const auto& [now, host, suppressed] : steps) {
        SetClock(now);
        const Values values = host.empty() ? Values{} : Values{{"%HOST%", host}};
        if (suppressed < 0) {
            ASSERT_EQ(send(values), 0);
        } else {
            const Json::Value notice = sent(values);
            EXPECT_TRUE(notice["time"].asInt64() == now && notice["suppressed"].asInt() == suppressed) << now;
        }
        ASSERT_EQ(send({}, "M"), 0) << "a channel that is not set up";
    }
}

// Each of the 512 hosts has sent at a second of its own.
TEST_F(Notices, TheOldestEntryOfAFullLedgerGivesWay) {
    filter_ = folder_.write("filter", "[T]\nchannels=\"email, desktop\"\ninterval=\"60\"\n");
    const auto entry = [](const std::string& host, int64_t sent) {
        std::string record = "T\n" + host;
        record.resize(240);
        return record.append(reinterpret_cast<const char*>(&sent), sizeof sent).append(8, '\0');
    };
    std::string ledger;
    for (int host = 0; host < 512; ++host) {
        ledger += entry(std::to_string(host), 1000 + (host + 200) % 512);
    }
    WriteFile(kSpool + "/ledger", ledger + "cut");
    SetClock(1515);
    sent({{"%HOST%", "new"}});
    ledger.replace(size_t{312} * 256, 256, entry("new", 1515));
    EXPECT_EQ(ReadFile(kSpool + "/ledger"), ledger + "cut");
}

TEST_F(Notices, PastTheBoundOfTheQueueAreCounted) {
    ASSERT_EQ(send({}), 0);
    arrived(1);
    std::vector<Descriptor> slots;
    ASSERT_TRUE(Eventually([&] { return (slots = takeSlots()).size() == kSlots; }));
    const std::string queue = kSpool + "/queue/desktop/000000000000000000";
    std::ofstream(queue + "00.00") << "not a notice";
    const mode_t mask = umask(0);
    std::filesystem::remove(kSpool + "/ledger");
    for (int i = 0; i < 210; ++i) {
        ASSERT_EQ(send({{"%SYSLOG_CONTENT%", std::to_string(i)}}), 0);
    }
    umask(mask);
    for (const char* name : {"", "/queue", "/queue/desktop", "/ledger", "/queue/desktop/00000000000000000003.00"}) {
        const bool folder = std::filesystem::is_directory(kSpool + name);
        EXPECT_EQ(std::filesystem::status(kSpool + name).permissions(), std::filesystem::perms{folder ? 0700U : 0600U});
    }
    std::filesystem::rename(queue + "07.00", queue + "07.01");
    ASSERT_EQ(send({{"%SYSLOG_CONTENT%", "new"}}), 0);
    const auto report = [](const char* channel, const char* /*subject*/, const char* cause, void* context) {
        *static_cast<std::string*>(context) += std::string(channel) + " " + cause;
    };
    std::string givenUp;
    EXPECT_EQ(QUORNotifyGivenUp(report, &givenUp), 1);
    EXPECT_EQ(givenUp, "desktop newer notices took its place");
    slots.clear();
    ASSERT_EQ(send({}), 0) << "held back too, but it starts a worker";
    const Json::Value last = arrived(200).back();
    EXPECT_EQ(last["body"].asString() + last["suppressed"].asString(), "new\n11");
    ASSERT_EQ(send({}), 0);
    EXPECT_EQ(arrived(201).back()["suppressed"].asInt(), 1);
}

TEST_F(Notices, FromManyProcessesAllArrive) {
    for (int caller = 0; caller < 4; ++caller) {
        if (fork() == 0) {
            int sent = 0;
            while (sent < 25 && send({}) == 0) {
                ++sent;
            }
            _exit(25 - sent);
        }
    }
    for (int status = 0; wait(&status) > 0;) {
        EXPECT_EQ(status, 0) << "a call failed";
    }
    arrived(100);
    EXPECT_EQ(std::filesystem::file_size(kSpool + "/ledger"), 0U) << "without an interval nothing is remembered";
}

TEST_F(Notices, TheDesktopSpoolIsTurnedOver) {
    ASSERT_EQ(send({}), 0);
    arrived(1);
    std::ofstream(kSpool + "/desktop.jsonl") << std::string(1U << 20U, '\n');
    ASSERT_EQ(send({}), 0);
    EXPECT_TRUE(Eventually([] { return std::filesystem::exists(kSpool + "/desktop.jsonl.1"); }));
    arrived(1);
}

TEST_F(Notices, GoWhereTheSettingsSay) {
    // Security, port, time-out, verified.
    const std::tuple<const char*, int, int, int32_t, bool> cases[]{
        {"smtp_security=none\nnotify_timeout=0\nwebhook_tls_verify=yes\nsmtp_tls_verify=yes\n", 0, 25, 30, true},
        {"smtp_security=tls\nnotify_timeout=1\nwebhook_tls_verify=no\nsmtp_tls_verify=no\n", 2, 465, 1, false},
        {"smtp_security=TLS\nsmtp_port=1\nnotify_timeout=300\n", 1, 1, 300, true},
        {"smtp_security=plain\nsmtp_port=65535\nnotify_timeout=301\n", 1, 65535, 300, true},
        {"smtp_port=65536\nnotify_timeout=-1\n", 1, 587, 30, true},
        {"smtp_port=0\nnotify_timeout=99999999999\n", 1, 587, 300, true}};
    const std::string longest(255, 's');
    QUORMAIL mail;
    for (const auto& [text, security, port, timeout, verify] : cases) {
        SCOPED_TRACE(text);
        settings(std::string("smtp_server=").append(longest).append("\nsmtp_user=too").append(longest + "\n" + text));
        ASSERT_EQ(QUORMailGet(&mail), 0);
        const auto read = notify::LoadSettings();
        EXPECT_EQ(std::tie(mail.security, mail.port, read->timeout, read->webhookVerify),
                  std::tie(security, port, timeout, verify));
        EXPECT_EQ(mail.verify, verify ? 1 : 0);
        EXPECT_EQ(std::string(mail.server) + mail.user, longest) << "half a name is somebody else's";
    }
    for (const char* enabled : {"yes", "no"}) {
        settings(std::string("sms_enabled=") + enabled);
        const Guard<QUORSMSCONF, QUORSmsConfFree> sms(QUORSmsConfGet());
        EXPECT_TRUE(sms != nullptr && (sms->enabled != 0) == (*enabled == 'y'));
    }
    std::filesystem::remove(paths::kSystemSettings);
    EXPECT_TRUE(QUORMailGet(&mail) == -1 && QUORMailGet(nullptr) == -1 && QUORSmsConfGet() == nullptr);
    EXPECT_EQ(QUORNotifyTest([](const char*, int, const char*, void*) {}, nullptr), -1);
    EXPECT_EQ(send({}), 0) << "no channel";
}

}  // namespace
}  // namespace quor::test
