#include "platform/notify/process.h"

#include <sys/syscall.h>
#include <unistd.h>

#include <csignal>

namespace quor::notify {

void CloseFrom(int first) {
#ifdef SYS_close_range
    if (syscall(SYS_close_range, static_cast<unsigned int>(first), ~0U, 0U) == 0) {
        return;
    }
#endif
    const auto end = static_cast<int>(sysconf(_SC_OPEN_MAX));
    for (int descriptor = first; descriptor < end; ++descriptor) {
        (void)close(descriptor);
    }
}

void ResetSignals() {
    for (int number = 1; number < NSIG; ++number) {
        (void)signal(number, SIG_DFL);
    }
    sigset_t none;
    (void)sigemptyset(&none);
    (void)sigprocmask(SIG_SETMASK, &none, nullptr);
}

}  // namespace quor::notify
