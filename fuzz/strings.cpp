// EncodeJson, readfileinreverse and Tokenize against plain forms of themselves.
#include <cstdlib>
#include <memory>

#include "common.h"
#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

void checkEncode(const std::string& text, int room) {
    std::string expected;
    for (const char c : std::string(text.c_str())) {
        expected.append(c == '"' || c == '\\' ? "\\" : "").append(1, c);
    }
    const std::unique_ptr<char[]> out(new char[static_cast<size_t>(room) + 1]);  // the sanitizer sees what is too much
    const int status = EncodeJson(text.c_str(), out.get(), room);
    Require((status == 0) == (expected.size() < static_cast<size_t>(room)), "it fits or fails");
    Require(status != 0 || expected == out.get(), "the text is escaped");
}

std::list<std::string> linesBackwards(const std::string& text) {
    std::list<std::string> lines = {""};
    for (const char c : text) {
        if (c == '\n') {
            lines.emplace_front();
        } else {
            lines.front() += c;
        }
    }
    for (std::string& line : lines) {
        line = std::string(line.c_str()).substr(0, 1023);
    }
    return lines;
}

void checkReverse(const std::string& text, int most) {
    const std::string path = quor::fuzz::ScratchPath("lines");
    quor::fuzz::WriteFile(path, text);
    FILE* file = fopen(path.c_str(), "rb");
    char** lines = nullptr;
    int count = 0;
    Require(readfileinreverse(file, &lines, count, most) == -1, "it always says -1");
    (void)fclose(file);
    const std::list<std::string> expected = linesBackwards(text);
    Require(static_cast<size_t>(count) == std::min(expected.size(), static_cast<size_t>(most)), "as many lines");
    auto line = expected.begin();
    for (int i = 0; i < count; ++i, ++line) {
        Require(*line == lines[i], "the same lines");
        free(lines[i]);
    }
    free(lines);
}

void checkTokenize(const std::string& text, const std::string& delimiters) {
    const std::list<std::string> pieces = Tokenize(text, delimiters);
    size_t size = pieces.empty() ? 0 : pieces.size() - 1;
    for (const std::string& piece : pieces) {
        Require(piece.find_first_of(delimiters) == std::string::npos, "no delimiter in a piece");
        size += piece.size();
    }
    Require(size == text.size(), "nothing is lost");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    FuzzedDataProvider data(bytes, size);
    const int room = data.ConsumeIntegralInRange(0, 300);
    const int most = data.ConsumeIntegralInRange(0, 20);
    const std::string delimiters = data.ConsumeRandomLengthString(4);
    const std::string text = data.ConsumeRemainingBytesAsString();
    checkEncode(text, room);
    checkReverse(text, most);
    checkTokenize(text, delimiters);
    return 0;
}
