#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

#include "quor/quorcore.h"
#include "support/temp_folder.h"

namespace {

int shell(const std::string& command) {
    return QLIBCExec("/bin/sh", "-c", command.c_str(), nullptr, nullptr);
}

TEST(Exec, TellsHowTheProgramEnded) {
    EXPECT_EQ(shell("exit 3"), 3);
    EXPECT_EQ(shell("kill -KILL $$"), 128 + SIGKILL);
}

TEST(Exec, FailsWhenNothingCouldBeRun) {
    EXPECT_LT(QLIBCExec("/no/such/program", "-c", nullptr), 0);
    EXPECT_LT(QLIBCExec("/etc/passwd", nullptr), 0) << "not executable";
}

TEST(Exec, PassesArgumentsWithoutAShell) {
    const quor::test::TempFolder folder;
    const std::string file = folder.path("$(id) `x` 'y' *");
    EXPECT_EQ(QLIBCExec("/usr/bin/touch", file.c_str(), nullptr), 0);
    EXPECT_EQ(QLIBCFileExist(file.c_str()), 1);
}

TEST(Exec, GivesNoDescriptorAndNoBlockedSignal) {
    const int inherited = dup2(STDERR_FILENO, 57);  // no close-on-exec
    EXPECT_EQ(shell("test /dev/null -ef /proc/self/fd/0 && test /dev/null -ef /proc/self/fd/1"), 0);
    sigset_t term;
    sigemptyset(&term);
    sigaddset(&term, SIGTERM);
    sigprocmask(SIG_BLOCK, &term, nullptr);
    EXPECT_NE(shell("test -e /proc/self/fd/57"), 0);
    EXPECT_EQ(shell("kill -TERM $$; exit 0"), 128 + SIGTERM);
    sigprocmask(SIG_UNBLOCK, &term, nullptr);
    close(inherited);
}

TEST(Exec, LeavesOtherChildrenToTheirOwner) {
    const pid_t other = fork();
    if (other == 0) {
        _exit(5);
    }
    EXPECT_EQ(shell("exit 0"), 0);
    int status = 0;
    ASSERT_EQ(waitpid(other, &status, 0), other);
    EXPECT_EQ(WEXITSTATUS(status), 5);
}

}  // namespace
