// A quorlogd of its own for one test: fed, signalled and read like the real one.
#ifndef TESTS_QUORLOGD_PROCESS_H
#define TESTS_QUORLOGD_PROCESS_H

#include <fcntl.h>
#include <sys/wait.h>

#include <csignal>

#include "support/testing.h"

namespace quor::test {

class Quorlogd {
  public:
    // `options` as a shell reads them.
    explicit Quorlogd(const std::string& options = "") {
        int ends[2];
        if (pipe2(ends, O_CLOEXEC) != 0) {
            throw std::runtime_error("no pipe for the test");
        }
        input_ = ends[1];
        const std::string command =
            "exec " QUORLOGD " --stderr " + options + " >/dev/null 2>>" + folder_.path("messages");
        pid_ = fork();
        if (pid_ == 0) {
            dup2(ends[0], STDIN_FILENO);
            execl("/bin/sh", "sh", "-c", command.c_str(), nullptr);
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
        return Eventually([&] { return messages().find(text) != std::string::npos; });
    }
    // Until the message is there that the signal asks for.
    bool saysWhenAsked(int number, const std::string& text) const {
        return Eventually([&] {
            signal(number);
            return messages().find(text) != std::string::npos;
        });
    }

  private:
    TempFolder folder_;
    int input_ = -1;
    pid_t pid_ = -1;
};

}  // namespace quor::test

#endif
