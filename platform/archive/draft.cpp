#include "platform/archive/draft.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <utility>

namespace quor::archive {
namespace {

std::string folderOf(const std::string& path) {
    const size_t slash = path.rfind('/');
    return slash == std::string::npos ? "." : path.substr(0, slash + 1);
}

}  // namespace

Draft::Draft(std::string target, const std::string& like) : target_(std::move(target)), path_(target_ + ".partial") {
    struct stat status {};
    struct stat there {};
    if (stat(like.c_str(), &status) != 0) {
        throw Problem("cannot read " + like + " (" + strerror(errno) + "); name a log database");
    }
    if (lstat(target_.c_str(), &there) == 0) {
        throw Problem(target_ + " exists already; name another file, or move it away");
    }
    file_ = Descriptor(open(path_.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0600));
    if (!file_ && errno == EEXIST) {
        throw Problem(path_ +
                      " exists already; another program writes it, or it is left of an earlier try: remove it then");
    }
    if (!file_) {
        fail("create");
    }
    (void)fchown(file_.get(), status.st_uid, status.st_gid);  // allowed to root only
    (void)fchmod(file_.get(), status.st_mode & 0666U);        // a file system without rights
}

Draft::~Draft() {
    if (file_ && !finished_) {
        (void)unlink(path_.c_str());
    }
}

void Draft::fail(const char* what) const {
    throw Problem(std::string("cannot ") + what + " " + target_ + " (" + strerror(errno) +
                  "); look at the space left and at the rights of its folder");
}

void Draft::finish() {
    const Descriptor folder(open(folderOf(target_).c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (fsync(file_.get()) != 0 || rename(path_.c_str(), target_.c_str()) != 0) {
        fail("write");
    }
    finished_ = true;
    (void)fsync(folder.get());  // some file systems cannot, and none loses a file that was forced to the disk
}

}  // namespace quor::archive
