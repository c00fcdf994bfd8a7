#include "tools/quorlogd/daemon.h"

#include <poll.h>
#include <sys/signalfd.h>
#include <syslog.h>
#include <unistd.h>

#include <csignal>
#include <stdexcept>
#include <utility>

#include "logger.h"
#include "tools/quorlogd/deliveries.h"

namespace quor {
namespace {

using std::chrono::seconds;

constexpr seconds kRetryFlush{60};  // each failed one may have waited for a lock, with input waiting meanwhile
constexpr char kEventText[] = "quorlogd " QUORLOGD_VERSION;

}  // namespace

Descriptor OpenSignals() {
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

Daemon::Daemon(const Options& options, Descriptor signals)
    : options_(options), signals_(std::move(signals)), watch_(options.db), receiver_(options), housekeeping_(options),
      losses_(options) {
    nextTick_ = nextCheck_ = Clock::now();
    nextFlush_ = nextTick_ + seconds(options.flushSeconds);
}

int Daemon::run() {
    syslog(LOG_INFO, "Started: %s", kEventText);
    (void)Logger().LogAddServStart(kEventText);  // reports its own failure
    while (!stopping_) {
        runTimers();
        wait();
        more_ = receiver_.takeRows();
    }
    receiver_.finish();
    syslog(LOG_INFO, "Stopped: %s", receiver_.statistics().c_str());
    (void)Logger().LogAddServStop(kEventText);  // reports its own failure
    return 0;
}

// For a change of the database, a signal or the next timer; not at all while rows are known to be there. A change is
// given a moment to be followed by others: each look costs more than a row.
void Daemon::wait() {
    constexpr int kTickMs = 1000;
    constexpr useconds_t kGatherMicroseconds = 20000;
    pollfd sources[] = {{signals_.get(), POLLIN, 0}, {watch_.descriptor(), POLLIN, 0}};
    if (poll(sources, 2, more_ ? 0 : kTickMs) <= 0) {
        return;
    }
    if (sources[0].revents != 0) {
        answerSignal();
    } else if (!more_) {
        (void)usleep(kGatherMicroseconds);
    }
    if (sources[1].revents != 0) {
        watch_.clear();
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
        ResumeDeliveries();
        const bool written = receiver_.flush();
        nextFlush_ = Clock::now() + (written ? seconds(options_.flushSeconds) : kRetryFlush);
    }
    if (now >= nextCheck_) {
        housekeeping_.check();
        losses_.check();
        crowding_.check();
        receiver_.announceHeldBack();
        RecordGivenUp();
        nextCheck_ = Clock::now() + seconds(options_.checkSeconds);
    }
}

}  // namespace quor
