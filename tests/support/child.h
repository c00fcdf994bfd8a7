// A program that a shell starts, fed through its standard input and signalled.
#ifndef TESTS_SUPPORT_CHILD_H
#define TESTS_SUPPORT_CHILD_H

#include <sys/wait.h>

#include <csignal>
#include <string_view>

#include "tests/support/testing.h"

namespace quor::test {

class Child {
  public:
    // `command` is one program with its arguments and the redirection of its output.
    explicit Child(const std::string& command) {
        const std::string file = folder_.path("pid");
        (void)::signal(SIGPIPE, SIG_IGN);
        pipe_ = popen(("echo $$ > " + file + "; exec " + command + " 2>" + folder_.path("messages")).c_str(), "we");
        Eventually([&] { return ReadFile(file).find('\n') != std::string::npos; });
        pid_ = std::stoi(ReadFile(file));
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child() {
        if (pipe_ != nullptr) {
            endOf(SIGKILL);
        }
    }

    void send(std::string_view text) {
        (void)fwrite(text.data(), 1, text.size(), pipe_);  // it may be gone
        (void)fflush(pipe_);
    }
    // Nothing once its end was waited for.
    void signal(int number) const {
        if (pipe_ != nullptr) {
            kill(pid_, number);
        }
    }
    // The exit status, or -1 when it was killed.
    int endOf(int number) {
        signal(number);
        siginfo_t info;
        waitid(P_PID, static_cast<id_t>(pid_), &info, WEXITED | WNOWAIT);
        return endOfInput();
    }
    int endOfInput() {
        const int status = pclose(std::exchange(pipe_, nullptr));
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }

    // What it wrote to its standard error.
    std::string messages() const { return ReadFile(folder_.path("messages")); }
    // Whether that holds `text` some seconds from now at the latest, asked for by a signal when one is given.
    bool says(const std::string& text, int number = 0) const {
        return Eventually([&] {
            signal(number);
            return messages().find(text) != std::string::npos;
        });
    }

  private:
    TempFolder folder_;
    FILE* pipe_ = nullptr;
    pid_t pid_ = -1;
};

}  // namespace quor::test

#endif
