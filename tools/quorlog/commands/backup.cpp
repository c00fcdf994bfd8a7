// backup.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>

#include "base/guards.h"
#include "base/paths.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct BackupOptions {
    std::string db = paths::kWorkingDb;
    std::string file;
};

void setup(CLI::App& command, BackupOptions& options) {
    command.add_option("file", options.file, "The file to create")->type_name("PATH")->required();
    AddDatabaseOption(command, options.db);
}

void requireRoom(const std::string& db, const std::string& folder) {
    constexpr uint64_t kMega = uint64_t{1} << 20U;
    struct statvfs volume {};
    if (statvfs(folder.c_str(), &volume) != 0) {
        throw Failure("cannot write to " + folder + ": " + strerror(errno) + "; give another file");
    }
    const uint64_t needed = store::SizeOf(db) + store::SizeOf(db + "-wal");
    const uint64_t left = static_cast<uint64_t>(volume.f_bavail) * volume.f_frsize;
    if (left < needed) {
        throw Failure("the backup may take " + std::to_string(needed / kMega + 1) + " MiB, and " + folder +
                          " has only " + std::to_string(left / kMega) + " MiB left; give a file on another disk",
                      store::Cause::Other);
    }
}

// A file of its own, which goes away unless it becomes what it should.
class Draft {
  public:
    explicit Draft(std::string target) : target_(std::move(target)), path_(target_ + ".XXXXXX") {
        if (!Descriptor(mkstemp(path_.data()))) {
            throw Failure("cannot write " + target_ + ": " + strerror(errno) + "; give another file",
                          store::Cause::Denied);
        }
    }
    Draft(const Draft&) = delete;
    Draft& operator=(const Draft&) = delete;
    ~Draft() {
        (void)unlink(path_.c_str());
        (void)unlink((path_ + "-journal").c_str());
    }

    const std::string& path() const { return path_; }
    void finish() const {
        const Descriptor file(open(path_.c_str(), O_RDONLY | O_CLOEXEC));
        if (!file || fsync(file.get()) != 0 || rename(path_.c_str(), target_.c_str()) != 0) {
            throw Failure("cannot write " + target_ + ": " + strerror(errno) + "; give another file",
                          store::Cause::Other);
        }
        (void)fchmod(file.get(), 0640);  // a disk without such modes is none the worse
    }

  private:
    std::string target_;
    std::string path_;
};

// In a process of its own, so that the draft is removed whatever signal ends this one. The exit status.
int copy(const std::string& db, const std::string& draft) {
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

int run(const BackupOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    const std::string target = store::AbsolutePath(options.file);
    struct stat there {};
    if (lstat(target.c_str(), &there) == 0) {
        throw Failure(target + " exists already; move it away or give another file");
    }
    requireRoom(db, std::filesystem::path(target).parent_path());
    store::RequireTable(db, "logs");
    const Draft draft(target);
    if (copy(db, draft.path()) != kDone) {
        Complain("no backup was made");
        return kFailed;
    }
    if (store::Ask(draft.path(), "PRAGMA quick_check", "quick_check") != std::vector<std::string>{"ok"}) {
        throw Failure("the backup is not sound; run quorlog db check on " + db, store::Cause::Damaged);
    }
    const uint64_t rows = Count(*store::OpenSource(draft.path()), {});
    draft.finish();
    WriteLine("saved " + std::to_string(rows) + (rows == 1 ? " row in " : " rows in ") + target);
    RecordDeed("Backed up " + db + " to " + target);
    return kDone;
}

}  // namespace

void AddBackup(CLI::App& app, int& status) {
    AddCommand<BackupOptions>(app, "backup", "Copy the log database, as it is now, while it is in use", status, setup,
                              run);
}

}  // namespace quor::cli
