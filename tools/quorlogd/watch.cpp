#include "tools/quorlogd/watch.h"

#include <sys/inotify.h>

#include <array>
#include <filesystem>

namespace quor {

FolderWatch::FolderWatch(const std::string& file) : signs_(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)) {
    const std::string folder = std::filesystem::path(file).parent_path();
    if (signs_ && inotify_add_watch(signs_.get(), folder.c_str(), IN_MODIFY | IN_CREATE | IN_MOVED_TO) < 0) {
        signs_ = Descriptor();
    }
}

void FolderWatch::clear() const {
    std::array<char, 16384> signs{};
    while (read(signs_.get(), signs.data(), signs.size()) > 0) {
    }
}

}  // namespace quor
