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

    // The outcomes of the test notice, a line each.
    static std::string tested() {
        std::string heard;
        const auto report = [](const char* channel, int ok, const char* detail, void* context) {
            *static_cast<std::string*>(context) += std::string(channel) + (ok != 0 ? " ok" : ": ") + detail + "\n";
        };
        const int tried = QUORNotifyTest(report, &heard);
        EXPECT_EQ(tried, std::count(begin(heard), end(heard), '\n'));
        return heard;
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

TEST_F(Delivery, EncryptedChannelsLogInAndCheckTheCertificate) {
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
        EXPECT_TRUE(std::regex_search(systemLog(1)[0], std::regex("Failed to send email\\..* or set smtp_ca_file")))
            << systemLog(1)[0];
        with("smtp_ca_file=\"" + certificate + "\"\n");
        EXPECT_EQ(server.received(1)[3], "user");
        with("smtp_tls_verify=\"no\"\n");
        EXPECT_NE(server.received(2)[0], "") << "not verified";
    }
    const Server web("https good", files);
    settings("webhook_url=\"https://127.0.0.1:" + web.port() + "\"\nwebhook_ca_file=\"" + certificate + "\"\n");
    ASSERT_EQ(send({}), 0);
    EXPECT_EQ(web.received(1)[0], "post");
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

TEST_F(Delivery, ChatServicesGetOneHarmlessField) {
    const Server text("http good");
    const Server content("http good");
    const std::string address = "_url=\"http://127.0.0.1:";
    settings("webhook_text" + address + text.port() + "\"\nwebhook_content" + address + content.port() + "/x\"\n");
    folder_.write("T.txt", "About %HOST%\n\n%SYSLOG_CONTENT%\n");
    const std::string hostile = "@everyone <!channel> ``` [a](http://b) \xE2\x80\xAE\xFF\t&";
    ASSERT_EQ(send({{"%HOST%", "@here"}, {"%SYSLOG_CONTENT%", hostile}}), 0);
    EXPECT_EQ(text.received(1), (Strings{"post", "application/json"}));
    EXPECT_EQ(text.body(1), "{\"text\":\"```\\nAbout ＠here\\n\\n＠everyone ‹!channel› ˋˋˋ [a](http：//b) "
                            "\xEF\xBF\xBD\xEF\xBF\xBD &\\n```\"}");
    EXPECT_EQ(content.received(1)[0], "post");
    EXPECT_EQ(content.body(1).substr(0, 11), "{\"content\":");

    std::string faces;  // two units each of the 4,000 or 2,000, of which 22 stand around them
    for (int i = 0; i < 2100; ++i) {
        faces += "\xF0\x9F\x98\x80";
    }
    ASSERT_EQ(send({{"%SYSLOG_CONTENT%", faces}}), 0);
    EXPECT_EQ(text.received(2)[0] + content.received(2)[0], "postpost");
    EXPECT_EQ(text.body(2), "{\"text\":\"```\\nAbout \\n\\n" + faces.substr(0, size_t{4} * 1989) + " [...]\\n```\"}");
    EXPECT_EQ(content.body(2).size(), text.body(2).size() + 3 - size_t{4} * 1000);
}

TEST_F(Delivery, ACommandGetsTheNoticeAndNothingElse) {
    const std::string seen = folder_.path("seen");
    const auto command = [&](const std::string& script) {
        std::string path = folder_.write("command", "#!/bin/sh\n" + script + "\n");
        std::filesystem::permissions(path, std::filesystem::perms{0700});
        settings("notify_command=\"" + path + "\"\nnotify_timeout=\"1\"\n");
        return path;
    };
    const std::string path =
        command("{ cat; env | grep -v ^PWD= | cut -d= -f1 | sort; echo $# $NOTICE_TAG $(pwd); } > " + seen +
                "\nsleep 60 & echo $! > " + seen + ".child");
    ASSERT_EQ(send({{"%HOST%", "$(h)"}}), 0);
    const Strings lines = awaitLines(seen + ".child", 1);
    const std::string json = awaitLines(seen, 8)[0];
    EXPECT_TRUE(json.rfind("{\"tag\":\"T\",", 0) == 0 && json.find("\"host\":\"$(h)\"") != std::string::npos) << json;
    EXPECT_EQ(ReadFile(seen).substr(json.size() + 1),
              "HOME\nLANG\nNOTICE_SUPPRESSED\nNOTICE_TAG\nNOTICE_TIME\nPATH\n0 T /\n");
    EXPECT_TRUE(Eventually([&] { return kill(std::stoi(lines[0]), 0) != 0; })) << "what it started goes on";

    command("echo 'no @!\tline'; exit 3");
    EXPECT_EQ(tested(), "command: the command ended with status 3; it said: no @! line \n");
    command("yes | head -c 1000000; exec sleep 60");
    EXPECT_EQ(tested().substr(0, 50), "command: the command took longer than 1 seconds an");
    std::filesystem::permissions(path, std::filesystem::perms{0720});
    EXPECT_NE(tested().find(" && chmod go-w "), std::string::npos);
    std::filesystem::permissions(path, std::filesystem::perms{0600});
    EXPECT_NE(tested().find("; run: chmod +x "), std::string::npos);
    std::filesystem::create_symlink(path, folder_.path("link"));
    for (const std::string& wrong : Strings{"command", folder_.path("none"), folder_.path("link")}) {
        settings("notify_command=\"" + wrong + "\"\n");
        EXPECT_TRUE(std::regex_search(tested(), std::regex("set notify_command|an absolute path"))) << tested();
    }
    EXPECT_EQ(ReadFile(folder_.path("syslog")), "");
    command("exit 100");
    ASSERT_EQ(send({}), 0);
    EXPECT_EQ(systemLog(1)[0], "Failed to send notice. command: the command ended with status 100; given up");
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
    ASSERT_TRUE(Eventually([] {
        const std::filesystem::directory_iterator all("/proc");
        return std::any_of(begin(all), end(all), isCleanWorker);
    }));
    for (const auto& process : std::filesystem::directory_iterator("/proc")) {
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
    const mode_t mask = umask(0);
    SetClock(1'700'000'000);
    const std::string heard = tested();
    umask(mask);
    EXPECT_EQ(QUORNotifyTest(nullptr, nullptr), -1);
    EXPECT_EQ(std::filesystem::status(std::string(paths::kNotifySpool) + "/desktop.jsonl").permissions(),
              std::filesystem::perms{0600});
    EXPECT_NE(awaitLines(std::string(paths::kNotifySpool) + "/desktop.jsonl", 1)[0].find("1700000000"),
              std::string::npos);
    EXPECT_TRUE(std::regex_match(heard, std::regex("desktop ok\nwebhook ok\nmail: .*; check address and port.*\n")))
        << heard;
    settings("webhook_url=\"http://127.0.0.1:" + server.port() + " x\"\n");
    EXPECT_EQ(tested().substr(0, 25), "webhook 1 ok\nwebhook 2: t");
}

}  // namespace
}  // namespace quor::test
