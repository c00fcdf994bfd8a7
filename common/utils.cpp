#include <algorithm>
#include <array>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <memory>

#include "common.h"
#include "common/guards.h"

std::string ullNumberToString(unsigned long long value) {
    std::array<char, 20> digits{};
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), value);
    return {digits.data(), end.ptr};
}

std::list<std::string> Tokenize(const std::string& text, const std::string& delimiters) {
    std::list<std::string> fields;
    if (text.empty()) {
        return fields;
    }
    size_t pos = 0;
    for (size_t end = text.find_first_of(delimiters); end != std::string::npos;
         end = text.find_first_of(delimiters, pos)) {
        fields.push_back(text.substr(pos, end - pos));
        pos = end + 1;
    }
    fields.push_back(text.substr(pos));
    return fields;
}

int EncodeJson(const char* in, char* out, int outSize) {
    if (in == nullptr || out == nullptr || in == out) {
        return -1;
    }
    int used = 0;
    for (; *in != '\0'; ++in) {
        const bool escaped = *in == '"' || *in == '\\';
        const int width = escaped ? 2 : 1;
        if (width > outSize - used) {
            return -1;
        }
        if (escaped) {
            out[used] = '\\';
        }
        out[used + width - 1] = *in;
        used += width;
    }
    if (used >= outSize) {
        return -1;
    }
    out[used] = '\0';
    return 0;
}

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

}  // namespace

int readfileinreverse(FILE* file, char*** lines, int& count, int maxLines) {
    if (file == nullptr || lines == nullptr || count < 0 || maxLines < 0) {
        return -1;
    }
    *lines = static_cast<char**>(calloc(static_cast<size_t>(maxLines), sizeof(char*)));
    if (*lines == nullptr) {
        perror("calloc");
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
