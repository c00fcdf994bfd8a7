#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <filesystem>
#include <fstream>

#include "common/paths.h"
#include "quor/quorservice.h"

namespace {

namespace fs = std::filesystem;

class ServiceReload : public testing::Test {
  protected:
    ServiceReload() {
        fs::create_directories(run_ / "nested");
        if (daemon_ == 0) {
            pause();
            _exit(0);
        }
    }
    ~ServiceReload() override {
        fs::remove_all(run_);
        kill(daemon_, SIGKILL);
        waitpid(daemon_, nullptr, 0);
    }

    void writePid(const char* file, const std::string& text) const { std::ofstream(run_ / file) << text; }

    // What ended the daemon: a HUP, as it does not catch it.
    int endOfDaemon() const {
        int status = 0;
        waitpid(daemon_, &status, 0);
        return WIFSIGNALED(status) ? WTERMSIG(status) : 0;
    }

    const fs::path run_ = quor::paths::kRunFolder;
    const pid_t daemon_ = fork();
};

TEST_F(ServiceReload, HangsUpTheProcessOfThePidFile) {
    writePid("flat.pid", std::to_string(daemon_) + "\n");
    EXPECT_EQ(QLIBServiceReload("flat"), 0);
    EXPECT_EQ(endOfDaemon(), SIGHUP);
    EXPECT_LT(QLIBServiceReload("flat"), 0) << "the process is gone";
}

TEST_F(ServiceReload, FindsThePidFileInTheFolderOfTheService) {
    writePid("nested/nested.pid", std::to_string(daemon_));
    EXPECT_EQ(QLIBServicectlJobReload("nested"), 0);
    EXPECT_EQ(endOfDaemon(), SIGHUP);
}

TEST_F(ServiceReload, SignalsNothingElse) {
    for (const std::string& text : {std::string(), std::string("0"), std::string("1"), std::string("-1"),
                                    std::to_string(daemon_) + "x", std::string("99999999999")}) {
        writePid("bad.pid", text);
        EXPECT_LT(QLIBServiceReload("bad"), 0) << text;
    }
    writePid("flat.pid", std::to_string(daemon_));
    for (const char* name : {"", "missing", "./flat", "nested/../flat", "-flat", "fl*t", "flat\n"}) {
        EXPECT_LT(QLIBServiceReload(name), 0) << name;
    }
    EXPECT_LT(QLIBServiceReload(nullptr), 0);
    EXPECT_EQ(waitpid(daemon_, nullptr, WNOHANG), 0) << "the daemon still runs";
}

}  // namespace
