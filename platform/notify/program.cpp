#include "platform/notify/program.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstring>

#include "platform/notify/process.h"

namespace quor::notify {
namespace {

using Clock = std::chrono::steady_clock;

constexpr size_t kKeptOutput = 300;
constexpr int kLookMs = 20;
constexpr int kCannotRun = 126;
constexpr int kFirstOther = STDERR_FILENO + 1;

// What goes wrong in a program must not take the machine along. It may have got less already.
void bound(int resource, rlim_t most) {
    rlimit limit{};
    if (getrlimit(resource, &limit) == 0) {
        limit.rlim_max = std::min(limit.rlim_max, most);
        limit.rlim_cur = std::min(limit.rlim_cur, limit.rlim_max);
        (void)setrlimit(resource, &limit);
    }
}

void setBounds(int32_t seconds) {
    constexpr rlim_t kMega = 1U << 20U;
    bound(RLIMIT_CORE, 0);
    bound(RLIMIT_CPU, static_cast<rlim_t>(seconds));
    bound(RLIMIT_DATA, 512 * kMega);
    bound(RLIMIT_FSIZE, 256 * kMega);
    bound(RLIMIT_NOFILE, 256);
}

// Descriptors may have low numbers themselves, where the caller has closed its own.
void setStandard(int input, int output) {
    const int in = fcntl(input, F_DUPFD, kFirstOther);
    const int out = fcntl(output, F_DUPFD, kFirstOther);
    (void)dup2(in, STDIN_FILENO);
    (void)dup2(out, STDOUT_FILENO);
    (void)dup2(out, STDERR_FILENO);
    CloseFrom(kFirstOther);
}

// A session of its own: no terminal, and a group that is ended as a whole. It does not outlive who watches it.
[[noreturn]] void become(const char* path, char* const* environment, int32_t seconds) {
    (void)setsid();
    (void)prctl(PR_SET_PDEATHSIG, SIGKILL);
    ResetSignals();
    (void)umask(077);
    setBounds(seconds);
    std::array<char*, 2> arguments{const_cast<char*>(path), nullptr};
    if (chdir("/") == 0) {
        (void)execve(path, arguments.data(), environment);
    }
    (void)dprintf(STDERR_FILENO, "it cannot be run: %s", strerror(errno));
    _exit(kCannotRun);
}

// Still to be reaped, so that no other process gets its number. Whoever cannot be asked about counts as ended.
bool hasEnded(pid_t child) {
    siginfo_t info{};
    return waitid(P_PID, static_cast<id_t>(child), &info, WEXITED | WNOHANG | WNOWAIT) != 0 || info.si_pid == child;
}

// False when there is nothing to read, or never will be.
bool readSome(const Descriptor& from, std::string& kept) {
    std::array<char, 4096> piece{};
    const ssize_t got = read(from.get(), piece.data(), piece.size());
    if (got > 0) {
        kept.append(piece.data(), std::min(static_cast<size_t>(got), kKeptOutput - kept.size()));
    }
    return got > 0;
}

// Reads on when enough is kept: a full pipe would stop the program.
ProgramEnd watch(pid_t child, const Descriptor& output, int32_t seconds) {
    const Clock::time_point until = Clock::now() + std::chrono::seconds(seconds);
    ProgramEnd end;
    pollfd source{output.get(), POLLIN, 0};
    for (bool ended = false; !ended && end.inTime;) {
        if (poll(&source, 1, kLookMs) > 0 && !readSome(output, end.output)) {
            source.fd = -1;
        }
        ended = hasEnded(child);
        end.inTime = ended || Clock::now() < until;
    }
    (void)kill(-child, SIGKILL);
    (void)kill(child, SIGKILL);
    (void)waitpid(child, &end.status, 0);
    while (end.output.size() < kKeptOutput && readSome(output, end.output)) {
    }
    return end;
}

std::vector<char*> pointers(const std::vector<std::string>& texts) {
    std::vector<char*> list;
    list.reserve(texts.size() + 1);
    for (const std::string& text : texts) {
        list.push_back(const_cast<char*>(text.c_str()));
    }
    list.push_back(nullptr);
    return list;
}

}  // namespace

std::optional<ProgramEnd> RunProgram(const std::string& path, const std::vector<std::string>& environment, int input,
                                     int32_t seconds) {
    const std::vector<char*> variables = pointers(environment);
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0) {
        return std::nullopt;
    }
    const Descriptor output(ends[0]);
    Descriptor theirs(ends[1]);
    (void)fcntl(output.get(), F_SETFL, O_NONBLOCK);
    const pid_t child = fork();
    if (child < 0) {
        return std::nullopt;
    }
    if (child == 0) {
        setStandard(input, theirs.get());
        become(path.c_str(), variables.data(), seconds);
    }
    theirs = Descriptor();
    return watch(child, output, seconds);
}

}  // namespace quor::notify
