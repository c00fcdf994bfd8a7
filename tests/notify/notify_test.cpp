#include <json/reader.h>
#include <json/value.h>
#include <sys/wait.h>

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
        notices.resize(count);
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
    const std::tuple<const char*, Values, const char*, const char*> cases[]{
        // template, values, subject, body
        {"%A% of %\n\n100%%A%% %B\n", {{"%A%", "x"}}, "x of %", "100%x% %B\n"},
        {"S\r\n\r\nHost: %HOST%\r\nEnd", {}, "S", "End\n"},
        {"%A%\n\n%A%\n", {{"%A%", "%HOST%"}, {"%HOST%", "h"}}, "%HOST%", "%HOST%\n"},
        {"S\n\n%SYSLOG_CONTENT%|%A%\n", {{"%SYSLOG_CONTENT%", R"(\"\\n\x)"}, {"%A%", R"(\")"}}, "S", "\"\\n\\x|\\\"\n"},
        {"%A%\n\n%A%\n", {{"%A%", "a\r\nBcc: x\x1b[31m\x7f"}}, "a  Bcc: x [31m ", "a\r\nBcc: x\x1b[31m\x7f\n"},
        {"%A%\n\n%A%\n", {{"%A%", "\xE9z"}}, "\xEF\xBF\xBDz", "\\xe9z\n"},
    };
    Json::Value notice;
    for (const auto& [text, values, subject, body] : cases) {
        folder_.write("T.txt", text);
        notice = sent(values);
        EXPECT_EQ(notice["subject"].asString(), subject) << text;
        EXPECT_EQ(notice["body"].asString(), body) << text;
    }
    EXPECT_EQ(notice["bodyBase64"].asString(), "6XoK");
}

TEST_F(Notices, FailWithoutATemplateThatHasASubject) {
    folder_.write("BLANK.txt", " \n\nbody\n");
    for (const char* tag : {"BLANK", "MISSING", "", "./T"}) {
        EXPECT_LT(send({}, tag), 0) << tag;
    }
    settings("");
    EXPECT_EQ(send({}), 0);
    EXPECT_FALSE(std::filesystem::exists(kSpool)) << "no channel, nothing to do";
}

TEST_F(Notices, TheShippedFilesServeEveryTag) {
    texts_ = SOURCE_FOLDER "/texts";
    filter_ = SOURCE_FOLDER "/etc/notify.filter";
    settings(ReadFile(SOURCE_FOLDER "/etc/quorinfo.conf.example"));
    const Values values{{"DESKTOP_NOTIFY_CLASSNAME", "App"},
                        {"%EPS%", "<value>"},
                        {"%SYSLOG_CONTENT%", "<value>"},
                        {"%SHARED_FOLDER%", "<value>"},
                        {"%DBPATH%", "<value>"}};
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
        SCOPED_TRACE(now);
        SetClock(now);
        const Values values = host.empty() ? Values{} : Values{{"%HOST%", host}};
        if (suppressed < 0) {
            ASSERT_EQ(send(values), 0);
        } else {
            const Json::Value notice = sent(values);
            EXPECT_EQ(notice["time"].asInt64(), now);
            EXPECT_EQ(notice["suppressed"].asInt(), suppressed);
        }
        ASSERT_EQ(send({}, "M"), 0) << "a channel that is not set up";
    }
}

TEST_F(Notices, TheLedgerStaysSmallAndReadable) {
    filter_ = folder_.write("filter", "[T]\nchannels=\"desktop\"\ninterval=\"60\"\n");
    std::filesystem::create_directories(kSpool);
    std::ofstream(kSpool + "/ledger") << std::string(100000, '\xFF') << "cut";
    for (int host = 0; host < 400; ++host) {
        ASSERT_EQ(send({{"%HOST%", std::to_string(host)}}), 0);
    }
    EXPECT_EQ(std::filesystem::file_size(kSpool + "/ledger"), 512U * 256U);
}

TEST_F(Notices, PastTheBoundOfTheQueueAreCounted) {
    ASSERT_EQ(send({}), 0);
    arrived(1);
    std::vector<Descriptor> slots;
    ASSERT_TRUE(Eventually([&] { return (slots = takeSlots()).size() == 3; }));
    std::ofstream(kSpool + "/queue/00000000000000000000") << "not a notice";
    for (int i = 0; i < 210; ++i) {
        ASSERT_EQ(send({{"%SYSLOG_CONTENT%", std::to_string(i)}}), 0);
    }
    slots.clear();
    ASSERT_EQ(send({}), 0) << "held back too, but it starts a worker";
    EXPECT_EQ(arrived(200).back()["body"].asString(), "198\n");
    ASSERT_EQ(send({}), 0);
    EXPECT_EQ(arrived(201).back()["suppressed"].asInt(), 12);
}

TEST_F(Notices, FromManyProcessesAllArrive) {
    for (int caller = 0; caller < 4; ++caller) {
        if (fork() == 0) {
            int failed = 0;
            for (int i = 0; i < 25; ++i) {
                failed += send({}) != 0 ? 1 : 0;
            }
            _exit(failed);
        }
    }
    for (int status = 0; wait(&status) > 0;) {
        EXPECT_EQ(status, 0) << "a call failed";
    }
    arrived(100);
}

TEST_F(Notices, TheDesktopSpoolIsTurnedOver) {
    ASSERT_EQ(send({}), 0);
    arrived(1);
    std::ofstream(kSpool + "/desktop.jsonl") << std::string(1U << 20U, '\n');
    ASSERT_EQ(send({}), 0);
    EXPECT_TRUE(Eventually([] { return std::filesystem::exists(kSpool + "/desktop.jsonl.1"); }));
    arrived(1);
    EXPECT_EQ(std::filesystem::status(kSpool + "/desktop.jsonl").permissions(), std::filesystem::perms{0600});
    EXPECT_EQ(std::filesystem::status(kSpool).permissions(), std::filesystem::perms{0700});
}

}  // namespace
}  // namespace quor::test
