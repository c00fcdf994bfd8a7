#include "platform/db/spill.h"

#include <fcntl.h>
#include <stdlib.h>
#include <sys/mman.h>
#include <unistd.h>

#include <string>

#include "base/files.h"

namespace quor {
namespace {

Descriptor openNameless(const std::string& folder) {
    Descriptor file(open(folder.c_str(), O_TMPFILE | O_RDWR | O_CLOEXEC, 0600));
    if (file) {
        return file;
    }
    std::string name = folder + "/quordb-XXXXXX";  // a file system without nameless files
    Descriptor named(mkostemp(name.data(), O_CLOEXEC));
    if (named) {
        unlink(name.c_str());
    }
    return named;
}

Descriptor openTemporary() {
    for (const char* folder : {static_cast<const char*>(getenv("TMPDIR")), "/var/tmp", "/tmp"}) {
        Descriptor file = folder != nullptr && *folder != '\0' ? openNameless(folder) : Descriptor();
        if (file) {
            return file;
        }
    }
    return Descriptor();
}

}  // namespace

void SpillFile::Unmap::operator()(char* memory) const {
    (void)munmap(memory, size);
}

bool SpillFile::write(const char* data, size_t size) {
    if (!file_) {
        file_ = openTemporary();
    }
    size_ += size;
    return WriteAll(file_.get(), {data, size});
}

char* SpillFile::map() {
    if (size_ == 0 || size_ > SIZE_MAX) {
        return nullptr;
    }
    const auto size = static_cast<size_t>(size_);
    void* memory = mmap(nullptr, size, PROT_READ, MAP_SHARED, file_.get(), 0);
    map_ = {memory != MAP_FAILED ? static_cast<char*>(memory) : nullptr, Unmap{size}};
    return map_.get();
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
    const auto offset = static_cast<size_t>(data - map_.get());
    const size_t begin = offset / page * page;
    (void)madvise(map_.get() + begin, offset + size - begin, advice);
}

}  // namespace quor
