#include "tools/quorlog/snapshot.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <vector>

#include "base/guards.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/failure.h"
#include "tools/quorlog/messages.h"

namespace quor::cli {

using store::Failure;

namespace {
constexpr const char kDraft[] = ".draft-";
}

Draft::Draft(std::string target) : target_(std::move(target)), path_(target_ + kDraft + "XXXXXX") {
    if (!Descriptor(mkstemp(path_.data()))) {
        throw Failure("cannot write " + target_ + ": " + strerror(errno) + "; give another file", store::Cause::Denied);
    }
}

Draft::~Draft() {
    (void)unlink(path_.c_str());
    (void)unlink((path_ + "-journal").c_str());
    store::RemoveCompanions(path_);
}

void RemoveDrafts(const std::string& target) {
    const std::filesystem::path path(target);
    const std::string begin = path.filename().string() + kDraft;
    std::error_code none;
    std::vector<std::filesystem::path> left;
    for (const auto& entry : std::filesystem::directory_iterator(path.parent_path(), none)) {
        if (entry.path().filename().string().rfind(begin, 0) == 0 && entry.is_regular_file(none)) {
            left.push_back(entry.path());
        }
    }
    for (const auto& draft : left) {
        (void)unlink(draft.c_str());
    }
}

void Draft::finish() const {
    const Descriptor file(open(path_.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file || fsync(file.get()) != 0 || rename(path_.c_str(), target_.c_str()) != 0) {
        throw Failure("cannot write " + target_ + ": " + strerror(errno) + "; give another file", store::Cause::Other);
    }
    (void)fchmod(file.get(), 0640);  // a disk without such modes is none the worse
}

int ReportIncomplete(const std::string& aside) {
    Complain("syslog-ng may still write to the former database: restart it, then run quorlog db merge " + aside);
    return kFailed;
}

// In a process of its own, so that the draft is removed whatever signal ends this one. The exit status.
int CopyDatabase(const std::string& db, const std::string& draft) {
    sigset_t watched;
    sigset_t before;
    sigemptyset(&watched);
    for (const int number : {SIGINT, SIGTERM, SIGHUP, SIGQUIT, SIGCHLD}) {
        sigaddset(&watched, number);
    }
    (void)signal(SIGCHLD, SIG_DFL);  // a caller may have had it ignored
    sigprocmask(SIG_BLOCK, &watched, &before);
    const pid_t child = fork();
    if (child == 0) {
        int status = kDone;
        try {
            (void)store::Ask(db, "VACUUM INTO " + store::Literal(draft), "");
        } catch (const Failure& failure) {
            Complain(failure.what());
            status = kFailed;
        }
        _exit(status);
    }
    int status = kFailed;
    if (child > 0) {
        if (sigwaitinfo(&watched, nullptr) != SIGCHLD) {
            (void)kill(child, SIGKILL);
        }
        const bool ended = waitpid(child, &status, 0) == child && WIFEXITED(status);
        status = ended ? WEXITSTATUS(status) : kFailed;
    }
    sigprocmask(SIG_SETMASK, &before, nullptr);
    return status;
}

}  // namespace quor::cli
