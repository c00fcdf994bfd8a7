#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdarg>

#include "quor/quorcore.h"

#ifdef __GLIBC_PREREQ
#if __GLIBC_PREREQ(2, 34)
#define QUOR_SPAWN_CLOSE_FROM  // elsewhere close-on-exec alone keeps descriptors from the program
#endif
#endif

namespace {

// What a program starts with, whatever its caller does: the caller's standard error and no other open file (what it
// reads or prints is not to mix with the caller's own input and output), no blocked signal, none of the signals ignored
// that daemons like to ignore.
class CleanStart {
  public:
    CleanStart() {
        posix_spawn_file_actions_init(&actions_);
        posix_spawn_file_actions_addopen(&actions_, STDIN_FILENO, "/dev/null", O_RDONLY, 0);
        posix_spawn_file_actions_addopen(&actions_, STDOUT_FILENO, "/dev/null", O_WRONLY, 0);
#ifdef QUOR_SPAWN_CLOSE_FROM
        posix_spawn_file_actions_addclosefrom_np(&actions_, STDERR_FILENO + 1);
#endif
        sigset_t signals;
        sigemptyset(&signals);
        posix_spawnattr_init(&attributes_);
        posix_spawnattr_setsigmask(&attributes_, &signals);
        for (const int number : {SIGHUP, SIGINT, SIGPIPE, SIGTERM, SIGCHLD}) {
            sigaddset(&signals, number);
        }
        posix_spawnattr_setsigdefault(&attributes_, &signals);
        posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGMASK | POSIX_SPAWN_SETSIGDEF);
    }
    CleanStart(const CleanStart&) = delete;
    CleanStart& operator=(const CleanStart&) = delete;
    ~CleanStart() {
        posix_spawnattr_destroy(&attributes_);
        posix_spawn_file_actions_destroy(&actions_);
    }

    const posix_spawn_file_actions_t* actions() const {
        return &actions_;
    }
    const posix_spawnattr_t* attributes() const {
        return &attributes_;
    }

  private:
    posix_spawn_file_actions_t actions_{};
    posix_spawnattr_t attributes_{};
};

int exitStatus(int status) {
    return WIFEXITED(status) ? WEXITSTATUS(status) : 128 + WTERMSIG(status);
}

int waitFor(pid_t child) {
    int status = 0;
    pid_t ended = -1;
    do {
        ended = waitpid(child, &status, 0);
    } while (ended < 0 && errno == EINTR);
    return ended == child ? exitStatus(status) : 0;  // a caller that ignores SIGCHLD never learns the status
}

int run(const char* program, char* const* arguments) {
    const CleanStart start;
    pid_t child = -1;
    const int error = posix_spawn(&child, program, start.actions(), start.attributes(), arguments, environ);
    return error == 0 ? waitFor(child) : -1;
}

}  // namespace

int QLIBCExec(const char* program, ...) {
    if (program == nullptr) {
        return -1;
    }
    std::array<char*, 64> arguments{const_cast<char*>(program)};
    size_t count = 0;
    va_list list;
    va_start(list, program);
    while (arguments[count] != nullptr && ++count < arguments.size()) {
        arguments[count] = va_arg(list, char*);  // NOLINT(clang-analyzer-valist.Uninitialized): it is
    }
    va_end(list);
    return count < arguments.size() ? run(program, arguments.data()) : -1;
}
