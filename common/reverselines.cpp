#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "common.h"

namespace {

constexpr size_t kLineBytes = 1024;

// The lines being stored, in the caller's array.
struct LineStore {
    char** lines;
    int& count;
    int maxLines;

    bool full() const { return count >= maxLines; }
    void add(const char* line) { lines[count++] = strdup(line); }
};

// `collected` holds a line's bytes from the last to the first.
void storeReversed(LineStore& store, const char* collected, size_t length) {
    std::array<char, kLineBytes> line{};
    const size_t kept = std::min(length, kLineBytes - 1);
    std::reverse_copy(collected + (length - kept), collected + length, line.data());
    store.add(line.data());
}

void storeLinesBackwards(FILE* file, long length, LineStore& store) {
    const auto collected = std::make_unique<char[]>(static_cast<size_t>(length) + 1);
    size_t used = 0;
    for (long pos = length - 1; pos >= 0 && !store.full(); --pos) {
        const int byte = fseek(file, pos, SEEK_SET) == 0 ? fgetc(file) : EOF;
        if (byte == EOF) {
            return;  // a file that cannot be read any further has no more lines to give
        }
        if (byte == '\n') {
            storeReversed(store, collected.get(), used);
            used = 0;
        } else {
            collected[used++] = static_cast<char>(byte);
        }
    }
    if (!store.full()) {
        storeReversed(store, collected.get(), used);
    }
}

// An array of null pointers, or null when there is no memory for it: for a negative size there never is.
char** newArray(int size) {
    if (size < 0) {
        errno = ENOMEM;
        return nullptr;
    }
    return static_cast<char**>(calloc(static_cast<size_t>(size), sizeof(char*)));
}

}  // namespace

int readfileinreverse(FILE* file, char*** lines, int& count, int maxLines) {
    if (lines == nullptr) {
        return -1;
    }
    *lines = newArray(maxLines);  // null wherever the call ends before there is an array
    if (*lines == nullptr) {
        perror("calloc");
        return -1;
    }
    if (file == nullptr || count < 0) {
        return -1;
    }
    LineStore store{*lines, count, maxLines};
    const long length = fseek(file, 0, SEEK_END) == 0 ? ftell(file) : -1;
    if (length == 0 && !store.full()) {
        store.add("");
    }
    if (length > 0 && !store.full()) {
        storeLinesBackwards(file, length, store);
    }
    return -1;
}
