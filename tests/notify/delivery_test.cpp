#include <poll.h>
#include <sys/wait.h>

#include <chrono>
#include <regex>

#include "tests/notify/fixture.h"

namespace quor::test {
namespace {

class Delivery : public Notify {
  protected:
    // A process that holds a slot of ours and nothing of its caller's.
    static bool isCleanWorker(const std::filesystem::path& process) {
        std::error_code gone;
        const auto link = [&](auto name) { return std::filesystem::read_symlink(process / name, gone).string(); };
        return link("fd/3").rfind(paths::kNotifySpool, 0) == 0 && link("fd/2") == "/dev/null" && link("cwd") == "/" &&
               ReadFile(process / "comm") == "quornotify\n" && getsid(std::stoi(process.filename())) != getsid(0) &&
               ReadFile(process / "status").find("Umask:\t0077") != std::string::npos;
    }
};

TEST_F(Delivery, MailsCarryWhatWasReceivedAndNoHeaderOfItsMaking) {
    const Server server("smtp good");
    settings(mailTo(server.port(), "smtp_sender=\"log@example.com\"\n"));
    folder_.write("T.txt", "About %KEYWORD%\n\n%SYSLOG_CONTENT%\n");
    const std::string longWord = "k\xC3\xA4\xE2\x82\xAC" + std::string(100, 'y') + "\xF0\x9F\x98\x80";
    // keyword, content, subject, body, its charset
    const std::tuple<std::string, std::string, std::string, std::string, const char*> cases[]{
        {"\xC3\xA4", "a\\\"b\\\\c\t\x1b[2J .\r\n.\r\nEND", "About \xC3\xA4", "a\"b\\c\t\x1b[2J .\r\n.\r\nEND", "utf-8"},
        {"=?utf-8?b?ZXZpbA==?=", "x", "About =?utf-8?b?ZXZpbA==?=", "x", "utf-8"},
        {"x\r\nBcc: evil@a.com\r\n\r\n", "caf\xC3\xA9", "About x  Bcc: evil@a.com    ", "caf\xC3\xA9", "utf-8"},
        {longWord, "caf\xE9 \xFF\xC3\xA9", "About " + longWord, "caf\xE9 \xFF\xC3\xA9", "iso-8859-1"}};
    const std::string headers =
        "auto-submitted,content-transfer-encoding,content-type,date,from,message-id,mime-version,subject,to";
    SetClock(1'700'000'000);
    int mails = 0;
    for (const auto& [keyword, content, subject, body, charset] : cases) {
        ASSERT_EQ(send({{"%KEYWORD%", keyword}, {"%SYSLOG_CONTENT%", content}}), 0);
        Strings received = server.received(++mails);
        EXPECT_TRUE(std::regex_match(received.back(), std::regex("<[0-9.]+@quornotify.invalid>"))) << received.back();
        received.pop_back();
        // Sessions at a time, sender, recipients, login, header names, defects, and what headers say.
        EXPECT_EQ(received,
                  (Strings{"1", "log@example.com", "one@example.com,two@example.com", "-", headers, "0", subject,
                           "log@example.com", "one@example.com, two@example.com", "1700000000", charset}));
        EXPECT_EQ(server.body(mails), body + "\n");
    }
}

TEST_F(Delivery, EncryptedMailLogsInAndChecksTheCertificate) {
    const std::string key = folder_.path("key.pem");
    const std::string certificate = folder_.path("cert.pem");
    const std::string command = "openssl req -x509 -newkey rsa:2048 -nodes -subj /CN=127.0.0.1 2>/dev/null "
                                "-addext subjectAltName=IP:127.0.0.1 -keyout " +
                                key + " -out " + certificate;
    ASSERT_EQ(system(command.c_str()), 0);
    const std::string files = certificate + " " + key;
    for (const std::string security : {"starttls", "tls"}) {
        SCOPED_TRACE(security);
        const Server server(std::string("smtp-").append(security).append(" good"), files);
        const auto with = [&](const std::string& more) {
            std::string text = mailTo(server.port(), "smtp_user=\"user\"\nsmtp_password=\"pass\"word\"\n" + more);
            settings(text.replace(text.find("none"), 4, security));
            ASSERT_EQ(send({}), 0);
        };
        std::filesystem::remove(folder_.path("syslog"));
        with("");
        EXPECT_NE(systemLog(1)[0].find("Failed to send email."), std::string::npos);
        with("smtp_ca_file=\"" + certificate + "\"\n");
        EXPECT_EQ(server.received(1)[3], "user");
        with("smtp_tls_verify=\"no\"\n");
        EXPECT_NE(server.received(2)[0], "") << "not verified";
    }
}

TEST_F(Delivery, MailThatFailsIsToldInTheSystemLog) {
    const Server refusing("smtp refuse");
    const Server stuck("smtp stuck");
    const std::vector<std::pair<std::string, std::string>> cases{
        {mailTo(refusing.port()), "550"},
        {mailTo(stuck.port(), "notify_timeout=\"1\"\n"), "timed out"},
        {"smtp_mail_enabled=yes\nsmtp_server=a/b\nsmtp_recipient=a@b\n", "check smtp_server"}};
    for (size_t i = 0; i < cases.size(); ++i) {
        settings(cases[i].first);
        ASSERT_EQ(send({}), 0);
        const std::string line = systemLog(i + 1)[i];
        EXPECT_TRUE(std::regex_match(line, std::regex("Failed to send email\\..*" + cases[i].second + ".*"))) << line;
    }
}

TEST_F(Delivery, OneUnknownRecipientCostsNobodyTheMailWhichCountsWhatWasHeldBack) {
    const Server server("smtp good");
    std::string text = mailTo(server.port());
    text.replace(text.find("one@"), 3, "unknown");
    settings(text);
    filter_ = folder_.write("filter", "[T]\ninterval=\"60\"\n");
    for (const time_t now : {1000, 1001, 1060}) {
        SetClock(now);
        ASSERT_EQ(send({}), 0);
    }
    EXPECT_EQ(server.received(1)[2] + server.received(2)[2], "two@example.comtwo@example.com");
    EXPECT_NE((server.body(1) + server.body(2)).find("held back: 1\n"), std::string::npos);
}

TEST_F(Delivery, WebhooksGetValidJsonAndTellTheirFailures) {
    const Server good("http good");
    const Server refusing("http refuse");
    const std::string invalid = "\xED\xA0\x80\xC0\xAF\xF4\x90\x80\x80\xE2\x82" + std::string(2000, '\x02');
    const auto url = [](const std::string& port) { return "http://127.0.0.1:" + port + "/hook"; };
    settings("webhook_url=\"" + url(refusing.port()) + " " + url(good.port()) + "\"\n");
    setenv("http_proxy", "http://127.0.0.1:9", 1);  // the caller's own
    ASSERT_EQ(send({{"%HOST%", "h\"\x01\xFF"}, {"%SYSLOG_CONTENT%", invalid}}), 0);
    unsetenv("http_proxy");
    EXPECT_EQ(good.received(1), (Strings{"post", "application/json"}));  // comes only when it is UTF-8 and JSON
    EXPECT_EQ(good.body(1).rfind("{\"tag\":\"T\",", 0), 0U) << good.body(1);
    EXPECT_EQ(systemLog(1)[0], "Failed to send notice. webhook: the server answered 500; it is tried again");

    ASSERT_EQ(send({{"%SYSLOG_CONTENT%", "quorlogd: Failed to send notice. webhook"}}), 0);
    settings("webhook_url=\"file:///etc/passwd\"\n");
    ASSERT_EQ(send({}), 0);
    EXPECT_NE(systemLog(2)[1], "");
    EXPECT_EQ(systemLog(2).size(), 2U) << "a notice about the failed notice would fail again";
}

TEST_F(Delivery, TheCallerNeitherWaitsNorKeepsAnything) {
    const Server server("smtp slow");
    settings(mailTo(server.port()));
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    const auto begun = std::chrono::steady_clock::now();
    for (int i = 0; i < 6; ++i) {
        ASSERT_EQ(send({}), 0);
    }
    const std::chrono::duration<double> passed = std::chrono::steady_clock::now() - begun;
    EXPECT_TRUE(Eventually([] {
        const std::filesystem::directory_iterator processes("/proc");
        return std::count_if(begin(processes), end(processes), isCleanWorker) == 2;
    }));
    EXPECT_LT(passed.count(), 1.5) << "one answer of the server takes longer than six calls";
    EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), 0) << "a zombie";  // the server alone is a child

    close(ends[1]);
    pollfd end{ends[0], POLLIN, 0};
    EXPECT_EQ(poll(&end, 1, 1000), 1) << "a worker holds the caller's pipe";
    close(ends[0]);
    EXPECT_EQ(server.received(6)[0], "2") << "deliveries at a time";
}

TEST_F(Delivery, AFailureIsTriedAgainUntilItIsGivenUp) {
    const auto tried = [](const char* times) {
        return Eventually([&] {
            const std::filesystem::directory_iterator waiting(paths::kNotifySpool + std::string("/queue/mail"));
            return takeSlots().size() == kSlots && std::any_of(begin(waiting), end(waiting), [&](const auto& entry) {
                       return entry.path().extension() == times;
                   });
        });
    };
    Strings givenUp;
    const auto report = [](const char* channel, const char* subject, const char* cause, void* context) {
        static_cast<Strings*>(context)->insert(static_cast<Strings*>(context)->end(), {channel, subject, cause});
    };
    const Server good("smtp good");
    const Server stuck("smtp stuck");
    const Server refusing("smtp refuse");
    SetClock(1000);
    settings(mailTo(refusing.port()));
    ASSERT_EQ(send({{"%HOST%", "refused"}}), 0);
    ASSERT_TRUE(tried(".01"));
    settings(mailTo(good.port()));
    SetClock(1029);
    EXPECT_EQ(QUORNotifyResume(), 0);
    SetClock(1030);
    EXPECT_TRUE(tried(".01")) << "too early";
    EXPECT_EQ(QUORNotifyResume(), 0);
    EXPECT_EQ(good.body(good.received(1).empty() ? 0 : 1).substr(0, 12), "Host refused");

    settings(mailTo(stuck.port()));
    ASSERT_EQ(send({{"%HOST%", "stuck"}}), 0);
    const std::filesystem::directory_iterator processes("/proc");
    ASSERT_TRUE(Eventually([] {
        const std::filesystem::directory_iterator all("/proc");
        return std::any_of(begin(all), end(all), isCleanWorker);
    }));
    for (const auto& process : processes) {
        if (isCleanWorker(process)) {
            kill(std::stoi(process.path().filename()), SIGKILL);
        }
    }
    ASSERT_TRUE(tried(".01")) << "what was on its way when its worker died is still there";
    settings(mailTo(refusing.port()));
    time_t now = 1030;
    for (const char* times :
         {".02", ".03", ".04", ".05", ".06", ".07", ".08", ".09", ".10", ".11", ".12", ".13", ".14", ".15"}) {
        SetClock(now += 7200);
        ASSERT_EQ(QUORNotifyResume(), 0);
        ASSERT_TRUE(tried(times)) << times;
    }
    EXPECT_EQ(QUORNotifyGivenUp(report, &givenUp), 0);
    SetClock(now + 7200);
    ASSERT_EQ(QUORNotifyResume(), 0);
    EXPECT_TRUE(Eventually([&] { return QUORNotifyGivenUp(report, &givenUp) == 1; }));
    EXPECT_EQ(QUORNotifyGivenUp(report, &givenUp), 0);
    ASSERT_EQ(givenUp.size(), 3U);
    EXPECT_EQ(givenUp[0] + " " + givenUp[1], "mail Subject");
    EXPECT_NE(givenUp[2].find("550"), std::string::npos);
    EXPECT_EQ(systemLog(2).size(), 2U) << "the first failure and the last";
}

TEST_F(Delivery, AStuckChannelHoldsUpNoOther) {
    const Server stuck("http stuck");
    const Server mail("smtp good");
    const std::string webhook = "webhook_url=\"http://127.0.0.1:" + stuck.port() + "\"\n";
    settings(mailTo(mail.port(), "desktop_notify_enabled=\"yes\"\nnotify_timeout=\"3\"\n" + webhook));
    for (int i = 0; i < 4; ++i) {
        ASSERT_EQ(send({}), 0);
    }
    EXPECT_NE(mail.received(4)[0], "");
    EXPECT_NE(awaitLines(std::string(paths::kNotifySpool) + "/desktop.jsonl", 4)[3], "");
    EXPECT_EQ(ReadFile(folder_.path("syslog")), "") << "the webhook has not even failed yet";
}

TEST_F(Delivery, TheTestNoticeTellsTheOutcomeOfEachChannel) {
    const Server server("http good");
    const std::string webhook = "webhook_url=\"http://127.0.0.1:" + server.port() + "\"\n";
    settings(mailTo("9", "desktop_notify_enabled=\"yes\"\n" + webhook));  // nobody listens there
    Strings heard;
    const auto report = [](const char* channel, int ok, const char* detail, void* context) {
        static_cast<Strings*>(context)->push_back(std::string(channel) + (ok != 0 ? " ok" : " failed") +
                                                  (*detail != '\0' ? ", cause" : ""));
    };
    const mode_t mask = umask(0);
    SetClock(1'700'000'000);
    EXPECT_EQ(QUORNotifyTest(report, &heard), 3);
    umask(mask);
    EXPECT_EQ(QUORNotifyTest(nullptr, &heard), -1);
    EXPECT_EQ(std::filesystem::status(std::string(paths::kNotifySpool) + "/desktop.jsonl").permissions(),
              std::filesystem::perms{0600});
    EXPECT_NE(awaitLines(std::string(paths::kNotifySpool) + "/desktop.jsonl", 1)[0].find("1700000000"),
              std::string::npos);
    EXPECT_EQ(heard, (Strings{"desktop ok", "webhook ok", "mail failed, cause"}));
}

}  // namespace
}  // namespace quor::test
