#include "tools/quorlogd/pidfile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <stdexcept>

#include "base/paths.h"

namespace quor {

PidFile::PidFile(const std::string& path) : file_(open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0644)) {
    if (!file_) {
        throw std::runtime_error("cannot write " + path + ": " + strerror(errno) + "; run as a user who may");
    }
    struct flock whole {};
    whole.l_type = F_WRLCK;
    whole.l_whence = SEEK_SET;
    if (fcntl(file_.get(), F_OFD_SETLK, &whole) != 0) {
        throw std::runtime_error("another quorlogd is running; see " + path + " for its number");
    }
    // Who may read the logs may also see whether somebody follows them.
    struct stat logs {};
    if (stat(std::filesystem::path(paths::kWorkingDb).parent_path().c_str(), &logs) == 0) {
        (void)fchown(file_.get(), static_cast<uid_t>(-1), logs.st_gid);
    }
    const std::string number = std::to_string(getpid()) + "\n";
    if (ftruncate(file_.get(), 0) != 0 || write(file_.get(), number.data(), number.size()) < 0) {
        throw std::runtime_error("cannot write " + path + ": " + strerror(errno) + "; see that its disk has room");
    }
}

}  // namespace quor
