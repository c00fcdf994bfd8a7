#include "tools/quorlog/pager.h"

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>

#include "base/files.h"
#include "base/words.h"
#include "store/failure.h"
#include "tools/quorlog/messages.h"

namespace quor::cli {
namespace {

using Words = std::vector<std::string>;

Words wordsOf(const char* text) {
    Words words;
    EachWord(text, " \t\n", [&](std::string_view word) { words.emplace_back(word); });
    return words;
}

bool isInstalled(const std::string& program) {
    if (program.find('/') != std::string::npos) {
        return access(program.c_str(), X_OK) == 0;
    }
    const char* const path = getenv("PATH");
    bool found = false;
    EachWord(path != nullptr ? path : "/usr/bin:/bin", ":", [&](std::string_view folder) {
        found = found || access(std::string(folder).append("/").append(program).c_str(), X_OK) == 0;
    });
    return found;
}

const char* wanted() {
    for (const char* variable : {"QUORLOG_PAGER", "PAGER"}) {
        const char* const value = getenv(variable);
        if (value != nullptr) {
            return value;
        }
    }
    return nullptr;
}

// Stands in for a pager that does not start: what it was to show must not be lost.
[[noreturn]] void copy() {
    std::array<char, 4096> bytes{};
    for (ssize_t size = 0; (size = read(STDIN_FILENO, bytes.data(), bytes.size())) > 0;) {
        if (!WriteAll(STDOUT_FILENO, {bytes.data(), static_cast<size_t>(size)})) {
            break;
        }
    }
    _exit(0);
}

// The text is UTF-8 whatever the locale says; and whoever may read logs, through sudo say, need not get a shell.
[[noreturn]] void run(const Words& command, int input) {
    (void)prctl(PR_SET_PDEATHSIG, SIGTERM);  // ^C ends both: a pager left behind would fight the shell for the terminal
    (void)dup2(input, STDIN_FILENO);
    (void)setenv("LESS", "FRXK", 0);
    (void)setenv("LESSCHARSET", "utf-8", 0);
    (void)setenv("LESSSECURE", "1", 1);
    std::vector<char*> words;
    for (const std::string& word : command) {
        words.push_back(const_cast<char*>(word.c_str()));  // execvp() leaves them as they are
    }
    words.push_back(nullptr);
    (void)execvp(words.front(), words.data());
    copy();
}

}  // namespace

std::vector<std::string> FindPager() {
    const char* const chosen = wanted();
    Words words = wordsOf(chosen != nullptr ? chosen : "less");
    if (words.empty() || words.front() == "cat") {
        return {};
    }
    if (!isInstalled(words.front())) {
        if (chosen != nullptr) {
            Complain("no pager '" + words.front() + "' is installed; set PAGER to one that is, or to cat for none");
        }
        return {};
    }
    return words;
}

Pager::Pager(const std::vector<std::string>& command) {
    std::array<int, 2> ends{-1, -1};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) {
        throw store::Failure(std::string("cannot start the pager: ") + strerror(errno) + "; give --no-pager",
                             store::Cause::Other);
    }
    const Descriptor output(ends[0]);
    input_ = Descriptor(ends[1]);
    process_ = fork();
    if (process_ == 0) {
        input_ = Descriptor();  // its end is seen only when nobody holds it
        run(command, output.get());
    }
    if (process_ < 0) {
        throw store::Failure(std::string("cannot start the pager: ") + strerror(errno) + "; give --no-pager",
                             store::Cause::Other);
    }
    (void)signal(SIGPIPE, SIG_IGN);  // leaving the pager early is no failure
}

Pager::~Pager() {
    input_ = Descriptor();
    (void)signal(SIGINT, SIG_IGN);  // the keys are the pager's now
    (void)signal(SIGQUIT, SIG_IGN);
    while (waitpid(process_, nullptr, 0) < 0 && errno == EINTR) {
    }
}

}  // namespace quor::cli
