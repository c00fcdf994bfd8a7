// A fresh world for one test: spool, settings, templates and the servers that notices go to.
#ifndef TESTS_NOTIFY_FIXTURE_H
#define TESTS_NOTIFY_FIXTURE_H

#include <fcntl.h>
#include <sys/file.h>

#include <map>
#include <sstream>

#include "common/handles.h"
#include "quor/quornotify.h"
#include "tests/support/clock.h"
#include "tests/support/testing.h"

namespace quor::test {

using Values = std::map<std::string, std::string>;

inline Strings linesOf(const std::string& text) {
    Strings lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

// A server of servers.py, with its own folder for what it received.
class Server {
  public:
    explicit Server(const std::string& kindAndMood, const std::string& certificate = "") {
        const std::string portFile = folder_.path("port");
        const std::string command = "/usr/bin/python3 " SOURCE_FOLDER "/tests/notify/servers.py " + kindAndMood + " " +
                                    folder_.path() + " " + certificate + " > " + portFile;
        pipe_.reset(popen(command.c_str(), "we"));
        Eventually([&] { return !(port_ = ReadFile(portFile)).empty(); });
    }

    const std::string& port() const { return port_; }
    // What the server recorded of its n-th message; empty when none comes.
    Strings received(int n) const {
        const std::string path = folder_.path(std::to_string(n));
        return Eventually([&] { return access(path.c_str(), F_OK) == 0; }) ? linesOf(ReadFile(path)) : Strings(9);
    }
    std::string body(int n) const { return ReadFile(folder_.path(std::to_string(n) + ".body")); }

  private:
    TempFolder folder_;
    std::unique_ptr<FILE, Releaser<pclose>> pipe_;
    std::string port_;
};

class Notify : public ::testing::Test {
  protected:
    Notify() {
        std::filesystem::remove_all(paths::kNotifySpool);
        settings("");
        CopySystemLogTo(folder_.path("syslog"));
        folder_.write("T.txt", "Subject\n\nHost %HOST%\n%SYSLOG_CONTENT%\n");
    }
    ~Notify() override {
        EXPECT_TRUE(Eventually([] { return takeSlots().size() == kSlots; })) << "a worker goes on";
        std::filesystem::remove(paths::kSystemSettings);
        CopySystemLogTo("");
        ResetClock();
    }

    static void settings(const std::string& text) { WriteFile(paths::kSystemSettings, text); }
    std::string mailTo(const std::string& port, const std::string& more = "") {
        return "smtp_mail_enabled=\"yes\"\nsmtp_server=\"127.0.0.1\"\nsmtp_port=\"" + port +
               "\"\nsmtp_recipient=\"one@example.com, two@example.com\"\nsmtp_security=\"none\"\n" + more;
    }

    int send(const Values& values, const std::string& tag = "T") {
        StringTable table(QLIBCSzHashAlloc(16));
        for (const auto& [key, value] : values) {
            EXPECT_EQ(QLIBCSzHashSetValue(Adopt(table), key.c_str(), value.c_str()), 0);
        }
        return QUORSysNotifySendNotificationCustomized(tag.c_str(), texts_.c_str(), filter_.c_str(), table.get(), 0);
    }

    static constexpr size_t kSlots = 8;

    // The workers' slots that are free, held as long as the result lives.
    static std::vector<Descriptor> takeSlots() {
        std::filesystem::create_directories(paths::kNotifySpool);
        std::vector<Descriptor> taken;
        for (const char* name :
             {"desktop0", "desktop1", "webhook0", "webhook1", "command0", "command1", "mail0", "mail1"}) {
            Descriptor slot(open((paths::kNotifySpool + std::string("/worker-") + name).c_str(),
                                 O_RDWR | O_CREAT | O_CLOEXEC, 0600));
            if (flock(slot.get(), LOCK_EX | LOCK_NB) == 0) {
                taken.push_back(std::move(slot));
            }
        }
        return taken;
    }

    // The lines of a file that workers append to, at least `count`: those that do not come are empty.
    static Strings awaitLines(const std::string& path, size_t count) {
        Strings lines;
        Eventually([&] { return (lines = linesOf(ReadFile(path))).size() >= count; });
        lines.resize(std::max(lines.size(), count));
        return lines;
    }
    Strings systemLog(size_t count) { return awaitLines(folder_.path("syslog"), count); }

    TempFolder folder_;
    std::string texts_ = folder_.path();
    std::string filter_;
};

}  // namespace quor::test

#endif
