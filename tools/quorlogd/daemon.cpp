#include "tools/quorlogd/daemon.h"

#include <poll.h>
#include <sys/signalfd.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <stdexcept>

#include "logger.h"

namespace quor {
namespace {

using std::chrono::seconds;

constexpr seconds kRetryFlush{60};  // each failed one may have waited for a lock, with input waiting meanwhile
constexpr char kEventText[] = "quorlogd " QUORLOGD_VERSION;

// A descriptor that reads the signals; nothing runs in a handler.
Descriptor openSignals() {
    (void)signal(SIGPIPE, SIG_IGN);
    (void)signal(SIGXFSZ, SIG_IGN);  // a full database is not the end
    sigset_t answered;
    sigemptyset(&answered);
    for (const int number : {SIGTERM, SIGINT, SIGHUP, SIGUSR1, SIGUSR2}) {
        sigaddset(&answered, number);
    }
    sigprocmask(SIG_BLOCK, &answered, nullptr);
    Descriptor descriptor(signalfd(-1, &answered, SFD_CLOEXEC | SFD_NONBLOCK));
    if (!descriptor) {
        throw std::runtime_error("cannot receive signals");
    }
    return descriptor;
}

}  // namespace

Daemon::Daemon(const Options& options, int input)
    : options_(options), input_(input), signals_(openSignals()), receiver_(options), housekeeping_(options) {
    nextTick_ = nextCheck_ = Clock::now();
    nextFlush_ = nextTick_ + seconds(options.flushSeconds);
}

int Daemon::run() {
    syslog(LOG_INFO, "Started: %s", kEventText);
    (void)Logger().LogAddServStart(kEventText);  // reports its own failure
    while (!stopping_) {
        runTimers();
        wait();
    }
    drain();
    receiver_.finish();
    syslog(LOG_INFO, "Stopped: %s", receiver_.statistics().c_str());
    (void)Logger().LogAddServStop(kEventText);  // reports its own failure
    return 0;
}

// For input, a signal or the next timer.
void Daemon::wait() {
    pollfd sources[] = {{signals_.get(), POLLIN, 0}, {input_, POLLIN, 0}};
    constexpr int kTickMs = 1000;
    if (poll(sources, 2, kTickMs) <= 0) {
        return;
    }
    if (sources[0].revents != 0) {
        answerSignal();
    }
    if (!stopping_ && sources[1].revents != 0 && !read()) {
        stopping_ = true;
    }
}

// False at the end of input.
bool Daemon::read() {
    const ssize_t count = ::read(input_, buffer_.data(), buffer_.size());
    if (count > 0) {
        receiver_.take({buffer_.data(), static_cast<size_t>(count)});
    }
    return count > 0 || (count < 0 && (errno == EINTR || errno == EAGAIN));
}

// What was already sent when a signal ended the process; a sender that goes on does not keep it alive.
void Daemon::drain() {
    constexpr int kMostChunks = 64;
    pollfd source{input_, POLLIN, 0};
    for (int i = 0; i < kMostChunks && poll(&source, 1, 0) > 0 && read(); ++i) {
    }
}

void Daemon::answerSignal() {
    signalfd_siginfo info{};
    if (::read(signals_.get(), &info, sizeof(info)) != sizeof(info)) {
        return;
    }
    switch (info.ssi_signo) {
    case SIGHUP:
        receiver_.reloadRules();
        break;
    case SIGUSR1:
        syslog(LOG_INFO, "Statistics: %s", receiver_.statistics().c_str());
        break;
    case SIGUSR2:
        (void)receiver_.flush();  // reports its own failure
        break;
    default:
        stopping_ = true;
    }
}

void Daemon::runTimers() {
    const Clock::time_point now = Clock::now();
    if (now < nextTick_) {
        return;
    }
    nextTick_ = now + seconds(1);
    receiver_.tick();
    if (now >= nextFlush_) {
        const bool written = receiver_.flushIfDue();
        nextFlush_ = Clock::now() + (written ? seconds(options_.flushSeconds) : kRetryFlush);
    }
    if (now >= nextCheck_) {
        housekeeping_.check();
        receiver_.reportBadLines();
        nextCheck_ = Clock::now() + seconds(options_.checkSeconds);
    }
}

}  // namespace quor
