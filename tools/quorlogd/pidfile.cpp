#include "tools/quorlogd/pidfile.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <stdexcept>

namespace quor {

PidFile::PidFile(const std::string& path) : file_(open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0644)) {
    if (!file_) {
        throw std::runtime_error("cannot write " + path + ": " + strerror(errno) + "; run as a user who may");
    }
    if (flock(file_.get(), LOCK_EX | LOCK_NB) != 0) {
        throw std::runtime_error("another quorlogd is running; see " + path + " for its number");
    }
    const std::string number = std::to_string(getpid()) + "\n";
    if (ftruncate(file_.get(), 0) != 0 || write(file_.get(), number.data(), number.size()) < 0) {
        throw std::runtime_error("cannot write " + path + ": " + strerror(errno) + "; see that its disk has room");
    }
}

}  // namespace quor
