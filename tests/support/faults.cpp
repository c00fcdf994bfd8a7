#include "tests/support/faults.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <new>

#include "tests/support/real.h"

namespace {

using quor::test::Real;
using quor::test::Resource;

// Plain numbers: allocations happen before anything is constructed.
bool armed;
bool lasting;
bool hit;
int left;
Resource failing;
int64_t blocks;

// `frees`: a full disk does not keep anyone from it.
bool fails(Resource resource, bool frees = false) {
    if (!armed || resource != failing || (frees && lasting) || --left > 0) {
        return false;
    }
    armed = lasting;
    hit = true;
    errno = resource == Resource::Memory ? ENOMEM : lasting ? ENOSPC : EIO;
    return true;
}

[[maybe_unused]] void* counted(void* block) {
    blocks += block != nullptr ? 1 : 0;
    return block;
}

}  // namespace

namespace quor::test {

Fault::Fault(Resource resource, int nth, bool onwards) {
    failing = resource;
    left = nth;
    lasting = onwards;
    hit = false;
    armed = true;
}

Fault::~Fault() {
    armed = false;
}

bool Fault::struck() {
    return hit;
}

int64_t LiveBlocks() {
    return blocks;
}

}  // namespace quor::test

// With files of 64 bits these names stand for open64, pwrite64 and so on. The system's own parameters have reserved
// names. NOLINTBEGIN(readability-inconsistent-declaration-parameter-name)

int open(const char* path, int flags, ...) {
    va_list arguments;
    va_start(arguments, flags);
    const auto mode = va_arg(arguments, mode_t);
    va_end(arguments);
    return fails(Resource::Disk) ? -1 : Real(open, "open64")(path, flags, mode);
}

// A call with these parameters that fails in its place; `frees` as above.
#define QUOR_FAULTY(type, failure, frees, name, real, parameters, ...)                                                 \
    type name parameters {                                                                                             \
        return fails(Resource::Disk, frees) ? (failure) : Real(name, real)(__VA_ARGS__);                               \
    }
QUOR_FAULTY(int, -1, false, mkostemp, "mkostemp64", (char* name, int flags), name, flags)
QUOR_FAULTY(FILE*, nullptr, false, fopen, "fopen64", (const char* path, const char* mode), path, mode)
QUOR_FAULTY(ssize_t, -1, false, write, "write", (int file, const void* data, size_t size), file, data, size)
QUOR_FAULTY(ssize_t, -1, false, pwrite, "pwrite64", (int file, const void* data, size_t size, off_t at), file, data,
            size, at)
QUOR_FAULTY(int, -1, false, ftruncate, "ftruncate64", (int file, off_t size) noexcept, file, size)
QUOR_FAULTY(int, -1, false, rename, "rename", (const char* from, const char* to) noexcept, from, to)
QUOR_FAULTY(int, -1, true, unlink, "unlink", (const char* path) noexcept, path)
QUOR_FAULTY(int, -1, false, mkdir, "mkdir", (const char* path, mode_t mode) noexcept, path, mode)

int fsync(int /*file*/) {
    return fails(Resource::Disk) ? -1 : 0;
}

int fdatasync(int file) {
    return fsync(file);
}

#ifdef __SANITIZE_ADDRESS__

void* operator new(size_t size) {
    void* block = fails(Resource::Memory) ? nullptr : malloc(size);
    if (block == nullptr) {
        throw std::bad_alloc();
    }
    return block;
}

void operator delete(void* block) noexcept {
    free(block);
}

void operator delete(void* block, size_t /*size*/) noexcept {
    free(block);
}

#else

extern "C" {

void* __libc_malloc(size_t size);
void* __libc_calloc(size_t count, size_t size);
void* __libc_realloc(void* block, size_t size);
void* __libc_memalign(size_t alignment, size_t size);
void __libc_free(void* block);

void* malloc(size_t size) noexcept {
    return fails(Resource::Memory) ? nullptr : counted(__libc_malloc(size));
}

void* calloc(size_t count, size_t size) noexcept {
    return fails(Resource::Memory) ? nullptr : counted(__libc_calloc(count, size));
}

void* realloc(void* block, size_t size) noexcept {
    return block == nullptr ? malloc(size) : fails(Resource::Memory) ? nullptr : __libc_realloc(block, size);
}

void* aligned_alloc(size_t alignment, size_t size) noexcept {
    return fails(Resource::Memory) ? nullptr : counted(__libc_memalign(alignment, size));
}

void free(void* block) noexcept {
    blocks -= block != nullptr ? 1 : 0;
    __libc_free(block);
}
}

#endif

// NOLINTEND(readability-inconsistent-declaration-parameter-name)
