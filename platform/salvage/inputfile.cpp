#include "platform/salvage/inputfile.h"

#include <fcntl.h>
#include <sys/stat.h>

#include "base/files.h"

namespace quor::salvage {

bool InputFile::open(const std::string& path) {
    file_ = Descriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));  // a pipe does not hang it
    struct stat status {};
    if (!file_ || fstat(file_.get(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return false;
    }
    size_ = static_cast<uint64_t>(status.st_size);
    return true;
}

size_t InputFile::read(uint64_t offset, uint8_t* out, size_t size) const {
    return ReadAt(file_, offset, out, size);
}

}  // namespace quor::salvage
