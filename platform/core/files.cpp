#include <sys/stat.h>
#include <unistd.h>

#include <string>

#include "base/guarded.h"
#include "quor/quorcore.h"
#include "quor/quorfs.h"

namespace {

struct Folder {
    uid_t uid;
    gid_t gid;
    mode_t mode;

    // Also true when it exists already: then nothing about it changes.
    bool create(const std::string& path) const {
        if (mkdir(path.c_str(), mode) != 0) {
            struct stat found {};
            return stat(path.c_str(), &found) == 0 && S_ISDIR(found.st_mode);
        }
        constexpr auto kKeep = static_cast<uid_t>(-1);
        return (uid == kKeep && gid == kKeep) || lchown(path.c_str(), uid, gid) == 0;
    }
};

int createAll(const std::string& path, const Folder& folder) {
    size_t end = 0;
    while (end != std::string::npos) {
        end = path.find('/', end + 1);
        if (!folder.create(path.substr(0, end))) {
            return -1;
        }
    }
    return 0;
}

}  // namespace

int QLIBCFileExist(const char* path) {
    return path != nullptr && access(path, F_OK) == 0 ? 1 : 0;
}

int QUORFSMkdirP(const char* path, int /*reserved1*/, int /*reserved2*/, int uid, int gid, unsigned int mode) {
    if (path == nullptr || *path == '\0') {
        return -1;
    }
    const Folder folder{static_cast<uid_t>(uid), static_cast<gid_t>(gid), mode & 07777};
    return quor::Guarded([&] { return createAll(path, folder); });
}
