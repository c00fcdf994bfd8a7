#include "spill.h"

#include <fcntl.h>
#include <stdlib.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <string>

namespace quor {
namespace {

int openNameless(const std::string& folder) {
    const int file = open(folder.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600);
    if (file >= 0) {
        return file;
    }
    std::string name = folder + "/quordb-XXXXXX";  // a file system without nameless files
    const int named = mkostemp(name.data(), O_CLOEXEC);
    if (named >= 0) {
        unlink(name.c_str());
    }
    return named;
}

int openTemporary() {
    const char* chosen = getenv("TMPDIR");
    for (const char* folder : {chosen, "/var/tmp", "/tmp"}) {
        const int file = folder != nullptr && *folder != '\0' ? openNameless(folder) : -1;
        if (file >= 0) {
            return file;
        }
    }
    return -1;
}

}  // namespace

SpillFile::~SpillFile() {
    if (map_ != nullptr) {
        munmap(map_, static_cast<size_t>(size_));
    }
    if (file_ >= 0) {
        close(file_);
    }
}

bool SpillFile::write(const char* data, size_t size) {
    if (file_ < 0) {
        file_ = openTemporary();
    }
    while (size > 0) {
        const ssize_t written = ::write(file_, data, size);
        if (written < 0 && errno != EINTR) {
            return false;
        }
        const size_t done = written > 0 ? static_cast<size_t>(written) : 0;
        data += done;
        size -= done;
        size_ += done;
    }
    return true;
}

char* SpillFile::map() {
    if (size_ == 0 || size_ > SIZE_MAX) {
        return nullptr;
    }
    void* memory = mmap(nullptr, static_cast<size_t>(size_), PROT_READ, MAP_SHARED, file_, 0);
    map_ = memory != MAP_FAILED ? static_cast<char*>(memory) : nullptr;
    return map_;
}

void SpillFile::drop(const char* data, size_t size) const {
    advise(data, size, MADV_DONTNEED);
}

void SpillFile::fetch(const char* data, size_t size) const {
#ifdef MADV_POPULATE_READ
    advise(data, size, MADV_POPULATE_READ);  // older kernels refuse it, and the pages come when they are touched
#else
    advise(data, size, MADV_WILLNEED);
#endif
}

void SpillFile::advise(const char* data, size_t size, int advice) const {
    const auto page = static_cast<size_t>(sysconf(_SC_PAGESIZE));
    const size_t begin = static_cast<size_t>(data - map_) / page * page;
    (void)madvise(map_ + begin, static_cast<size_t>(data - map_) + size - begin, advice);
}

}  // namespace quor
