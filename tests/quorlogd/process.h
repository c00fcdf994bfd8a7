// A quorlogd of its own for one test: fed, signalled and read like the real one.
#ifndef TESTS_QUORLOGD_PROCESS_H
#define TESTS_QUORLOGD_PROCESS_H

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <string>
#include <thread>
#include <vector>

#include "support/temp_folder.h"

namespace quor::test {

class Quorlogd {
  public:
    explicit Quorlogd(std::vector<std::string> options = {}) {
        options.insert(options.begin(), {"/bin/sh", "-c", "exec " QUORLOGD " \"$@\"", "quorlogd", "--stderr"});
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0) {
            throw std::runtime_error("no pipe for the test");
        }
        input_ = ends[1];
        const std::string messages = folder_.path("messages");
        std::vector<char*> arguments(options.size() + 1);
        std::transform(options.begin(), options.end(), arguments.begin(), [](std::string& o) { return o.data(); });
        pid_ = fork();
        if (pid_ == 0) {
            dup2(ends[0], STDIN_FILENO);
            dup2(open("/dev/null", O_WRONLY), STDOUT_FILENO);
            dup2(open(messages.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0600), STDERR_FILENO);
            execv(arguments[0], arguments.data());
            _exit(127);
        }
        close(ends[0]);
    }
    Quorlogd(const Quorlogd&) = delete;
    Quorlogd& operator=(const Quorlogd&) = delete;
    ~Quorlogd() {
        if (pid_ > 0) {
            signal(SIGKILL);
            waitForExit();
        }
        closeInput();
    }

    void send(std::string_view text) {
        while (!text.empty()) {
            const ssize_t written = write(input_, text.data(), text.size());
            if (written < 0) {
                return;  // it is gone
            }
            text.remove_prefix(static_cast<size_t>(written));
        }
    }
    void closeInput() {
        if (input_ >= 0) {
            close(std::exchange(input_, -1));
        }
    }
    void signal(int number) const { kill(pid_, number); }
    bool started() const { return says("Started: "); }  // and answers signals
    // The exit status, or -1 after a signal.
    int waitForExit() {
        int status = 0;
        waitpid(std::exchange(pid_, -1), &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    std::string messages() const { return ReadFile(folder_.path("messages")); }
    // Whether a message holds `text` some seconds from now at the latest.
    bool says(const std::string& text) const {
        return eventually([&] { return messages().find(text) != std::string::npos; });
    }
    template <typename Condition>
    static bool eventually(Condition condition) {
        constexpr int kTries = 1000;
        for (int i = 0; i < kTries; ++i) {
            if (condition()) {
                return true;
            }
            std::this_thread::sleep_for(std::chrono::milliseconds(10));
        }
        return false;
    }

  private:
    TempFolder folder_;
    int input_ = -1;
    pid_t pid_ = -1;
};

}  // namespace quor::test

#endif
