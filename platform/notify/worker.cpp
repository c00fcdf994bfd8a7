#include "platform/notify/worker.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <syslog.h>
#include <unistd.h>

#include <csignal>
#include <ctime>
#include <optional>

#include "platform/notify/oneline.h"
#include "platform/notify/process.h"

namespace quor::notify {
namespace {

constexpr int kSlotDescriptor = 3;

// No handler of the caller runs in the children.
class SignalsHeld {
  public:
    SignalsHeld() {
        sigset_t all;
        (void)sigfillset(&all);
        (void)sigprocmask(SIG_SETMASK, &all, &before_);
    }
    SignalsHeld(const SignalsHeld&) = delete;
    SignalsHeld& operator=(const SignalsHeld&) = delete;
    ~SignalsHeld() { (void)sigprocmask(SIG_SETMASK, &before_, nullptr); }

  private:
    sigset_t before_{};
};

// Keeps the slot alone. The system log's connection must be closed by its owner, or its number would be written to
// after something else got it.
void closeInherited(int slot) {
    closelog();
    (void)dup2(fcntl(slot, F_DUPFD, kSlotDescriptor), kSlotDescriptor);
    CloseFrom(kSlotDescriptor + 1);
    const int null = open("/dev/null", O_RDWR);
    for (int standard = STDIN_FILENO; standard <= STDERR_FILENO; ++standard) {
        (void)dup2(null, standard);
    }
    CloseFrom(kSlotDescriptor + 1);
}

// Only the first failure and the last are told: the same one every hour helps nobody.
void conclude(const Channel& channel, const Delivery& delivery, const Outcome& outcome) {
    if (outcome.cause.empty()) {
        delivery.remove();
        return;
    }
    const std::string cause = OneLine(outcome.cause, 400);
    const bool last = outcome.hopeless || delivery.isLast();
    if (last || delivery.tries == 1) {
        syslog(LOG_ERR, "%s %s: %s; %s", channel.failure, channel.name, cause.c_str(),
               last ? "given up" : "it is tried again");
    }
    if (last) {
        const Spool spool(kWaitForever);
        spool.giveUp(channel.name, delivery.notice, cause);
        delivery.remove();
    }
}

// Finding nothing due and giving the slot back happen under one lock: a caller that saw no free slot has its notice in
// the queue already, and this worker finds it.
void deliverQueue(const Channel& channel) {
    for (;;) {
        std::optional<Delivery> delivery;
        {
            const Spool spool(kWaitForever);
            delivery = spool ? spool.take(channel.name, time(nullptr)) : std::nullopt;
            if (!delivery) {
                (void)flock(kSlotDescriptor, LOCK_UN);
                return;
            }
        }
        conclude(channel, *delivery, Deliver(channel, delivery->notice));
    }
}

[[noreturn]] void work(const Worker& worker) {
    closeInherited(worker.slot.get());
    ResetSignals();
    (void)signal(SIGPIPE, SIG_IGN);
    (void)umask(077);
    openlog("quornotify", LOG_PID, 0);  // in the caller's facility
    (void)prctl(PR_SET_NAME, "quornotify");
    if (chdir("/") == 0) {
        deliverQueue(*worker.channel);
    }
    _exit(0);
}

// Forked from the caller, which has no threads. An exception ends the process instead of unwinding the caller's frames,
// and _exit leaves the caller's buffers and exit handlers alone.
[[noreturn]] void detach(const std::vector<Worker>& workers) noexcept {
    (void)setsid();
    int status = 0;
    for (const Worker& worker : workers) {
        const pid_t child = fork();
        if (child == 0) {
            work(worker);
        }
        status |= child < 0 ? 1 : 0;
    }
    _exit(status);
}

}  // namespace

std::vector<Worker> WorkersNeeded(const Spool& spool) {
    std::vector<Worker> workers;
    for (const Channel& channel : Channels()) {
        if (spool.isAnyDue(channel.name, time(nullptr))) {
            Descriptor slot = spool.freeSlot(channel.name);
            if (slot) {
                workers.push_back({&channel, std::move(slot)});
            }
        }
    }
    return workers;
}

int StartWorkers(const std::vector<Worker>& workers) {
    if (workers.empty()) {
        return 0;
    }
    const SignalsHeld held;
    const pid_t child = fork();
    if (child < 0) {
        return -1;
    }
    if (child == 0) {
        detach(workers);
    }
    int status = 0;
    if (waitpid(child, &status, 0) != child) {
        return 0;  // the caller ignores its children: the system has reaped it
    }
    return status == 0 ? 0 : -1;
}

}  // namespace quor::notify
