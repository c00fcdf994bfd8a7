#include <sys/stat.h>
#include <sys/wait.h>

#include <csignal>

#include "common/guards.h"
#include "quor/quorcore.h"
#include "quor/quorfs.h"
#include "quor/quorservice.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

TEST(StringTable, KeepsManyEntriesReplacesAndCopies) {
    quor::StringTable table(QLIBCSzHashAlloc(1));
    for (int i = 0; i < 1000; ++i) {
        std::string key = "key" + std::to_string(i);
        ASSERT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key.c_str(), "old"), 0);
        ASSERT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key.c_str(), std::to_string(i).c_str()), 0);
        key.assign(key.size(), 'x');
    }
    EXPECT_STREQ(QLIBCSzHashGetValue(table.get(), "key0"), "0");
    EXPECT_STREQ(QLIBCSzHashGetValue(table.get(), "key999"), "999");
    EXPECT_EQ(QLIBCSzHashGetValue(table.get(), "key1000"), nullptr);
}

TEST(CoreLibrary, RefusesNonsenseAndFormatsAnyLength) {
    quor::StringTable table(QLIBCSzHashAlloc(8));
    QLIBSZHASH* none = nullptr;
    for (const int status :
         {QLIBCSzHashSetValue(nullptr, "k", "v"), QLIBCSzHashSetValue(&none, "k", "v"),
          QLIBCSzHashSetValue(quor::Adopt(table), nullptr, "v"), QLIBCSzHashSetValue(quor::Adopt(table), "k", nullptr),
          QLIBCExec(nullptr), QLIBServiceReload(nullptr), QUORFSMkdirP(nullptr, 0, 1, -1, -1, 0777)}) {
        EXPECT_LT(status, 0);
    }
    EXPECT_EQ(QLIBCSzHashGetValue(nullptr, "k"), nullptr);
    EXPECT_EQ(QLIBCSzHashGetValue(table.get(), nullptr), nullptr);
    EXPECT_EQ(QLIBCSzHashAlloc(0), nullptr);
    EXPECT_EQ(QLIBCSzListAlloc(-1), nullptr);
    EXPECT_EQ(QLIBCFileExist(nullptr), 0);
    QLIBCSzHashFree(nullptr);
    QLIBCSzListFree(nullptr);
    QLIBCStrPut(nullptr);
    const std::string text(100000, '%');
    EXPECT_EQ(quor::PlatformText(QLIBCStrGet("[%s] %d", text.c_str(), -1)).get(), "[" + text + "] -1");
}

int shell(const std::string& command) {
    return QLIBCExec("/bin/sh", "-c", command.c_str(), nullptr, nullptr);
}

TEST(Exec, TellsHowTheProgramEnded) {
    EXPECT_EQ(shell("exit 3"), 3);
    EXPECT_EQ(shell("kill -KILL $$"), 128 + SIGKILL);
}

// Not under emulation, which runs the child of vfork on its own.
TEST(Exec, FailsWhenNothingCouldBeRun) {
    EXPECT_LT(QLIBCExec("/no/such/program", "-c", nullptr), 0);
    EXPECT_LT(QLIBCExec("/etc/passwd", nullptr), 0) << "not executable";
}

TEST(Exec, PassesArgumentsWithoutAShell) {
    const TempFolder folder;
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
    const pid_t other = fork();
    if (other == 0) {
        _exit(5);
    }
    EXPECT_EQ(shell("exit 0"), 0) << "other children are left to their owner";
    int status = 0;
    ASSERT_EQ(waitpid(other, &status, 0), other);
    EXPECT_EQ(WEXITSTATUS(status), 5);
}

TEST(MkdirP, CreatesMissingParentsWithTheMode) {
    const TempFolder folder;
    const mode_t mask = umask(027);
    EXPECT_EQ(QUORFSMkdirP(folder.path("a//b/c/").c_str(), 0, 1, -1, -1, 0777), 0);
    umask(mask);
    struct stat found {};
    ASSERT_EQ(stat(folder.path("a/b").c_str(), &found), 0);
    EXPECT_EQ(found.st_mode & 07777, 0750U);
    EXPECT_EQ(QUORFSMkdirP(folder.path("a/b/c").c_str(), 0, 1, -1, -1, 0700), 0) << "exists already";
    const std::string file = folder.write("file", "");
    for (const std::string& path : {std::string(), file, file + "/below", std::string("/proc/none")}) {
        EXPECT_LT(QUORFSMkdirP(path.c_str(), 0, 1, -1, -1, 0777), 0) << path;
    }
}

class ServiceReload : public testing::Test {
  protected:
    ServiceReload() {
        if (daemon_ == 0) {
            pause();
            _exit(0);
        }
    }
    ~ServiceReload() override {
        std::filesystem::remove_all(run_);
        kill(daemon_, SIGKILL);
        waitpid(daemon_, nullptr, 0);
    }

    // What ended the daemon: a HUP, as it does not catch it.
    int endOfDaemon() const {
        int status = 0;
        waitpid(daemon_, &status, 0);
        return WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    }

    const std::string run_ = quor::paths::kRunFolder;
    const pid_t daemon_ = fork();
};

TEST_F(ServiceReload, HangsUpTheProcessOfThePidFile) {
    WriteFile(run_ + "/flat.pid", std::to_string(daemon_) + "\n");
    EXPECT_EQ(QLIBServiceReload("flat"), 0);
    EXPECT_EQ(endOfDaemon(), SIGHUP);
    EXPECT_LT(QLIBServiceReload("flat"), 0) << "the process is gone";
}

TEST_F(ServiceReload, FindsThePidFileInTheFolderOfTheService) {
    WriteFile(run_ + "/nested/nested.pid", std::to_string(daemon_));
    EXPECT_EQ(QLIBServicectlJobReload("nested"), 0);
    EXPECT_EQ(endOfDaemon(), SIGHUP);
}

TEST_F(ServiceReload, SignalsNothingElse) {
    for (const std::string text : {"", "0", "1", "-1", "99999999999", "%x"}) {
        WriteFile(run_ + "/bad.pid", text == "%x" ? std::to_string(daemon_) + "x" : text);
        EXPECT_LT(QLIBServiceReload("bad"), 0) << text;
    }
    WriteFile(run_ + "/flat.pid", std::to_string(daemon_));
    for (const char* name : {"", "missing", "./flat", "nested/../flat", "-flat", "fl*t", "flat\n"}) {
        EXPECT_LT(QLIBServiceReload(name), 0) << name;
    }
    EXPECT_EQ(waitpid(daemon_, nullptr, WNOHANG), 0) << "the daemon still runs";
}

}  // namespace
