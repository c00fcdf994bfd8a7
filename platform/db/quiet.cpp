#include "platform/db/quiet.h"

#include <fcntl.h>
#include <unistd.h>

#include <filesystem>

namespace quor {
namespace {

// The bytes on which SQLite's readers have a lock of their own; without all of them nobody moves a write-ahead log into
// the file when he closes it.
constexpr off_t kSharedFirst = 0x40000002;
constexpr off_t kSharedSize = 510;

bool lockAsReader(const Descriptor& file) {
    struct flock lock {};
    lock.l_type = F_RDLCK;
    lock.l_whence = SEEK_SET;
    lock.l_start = kSharedFirst;
    lock.l_len = kSharedSize;
    return fcntl(file.get(), F_OFD_SETLK, &lock) == 0;
}

bool exists(const std::string& path) {
    return access(path.c_str(), F_OK) == 0;
}

}  // namespace

Descriptor HoldQuiet(const std::string& path) {
    std::error_code failed;
    const std::filesystem::path real = std::filesystem::canonical(path, failed);
    if (failed || access(real.c_str(), W_OK) == 0 || access(real.parent_path().c_str(), W_OK) == 0) {
        return Descriptor();
    }
    Descriptor file(open(real.c_str(), O_RDONLY | O_CLOEXEC));
    const bool held = file && lockAsReader(file);
    return held && !exists(real.string() + "-wal") && !exists(real.string() + "-journal") ? std::move(file)
                                                                                          : Descriptor();
}

std::string QuietName(const std::string& path) {
    std::string name = "file:";
    for (const char c : std::filesystem::absolute(path).string()) {
        switch (c) {
        case '%':
            name += "%25";
            break;
        case '?':
            name += "%3f";
            break;
        case '#':
            name += "%23";
            break;
        default:
            name += c;
        }
    }
    return name + "?immutable=1";
}

}  // namespace quor
