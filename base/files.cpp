#include "base/files.h"

#include <cerrno>

namespace quor {

bool WriteAll(int file, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = write(file, bytes.data(), bytes.size());
        if (written < 0 && errno != EINTR) {
            return false;
        }
        bytes.remove_prefix(written > 0 ? static_cast<size_t>(written) : 0);
    }
    return true;
}

size_t ReadAt(const Descriptor& file, uint64_t offset, void* out, size_t size) {
    size_t done = 0;
    while (done < size) {
        const auto at = static_cast<off_t>(offset + done);
        const ssize_t got = pread(file.get(), static_cast<char*>(out) + done, size - done, at);
        if (got == 0 || (got < 0 && errno != EINTR)) {
            break;
        }
        done += got > 0 ? static_cast<size_t>(got) : 0;
    }
    return done;
}

}  // namespace quor
