#include "support/system_log.h"

#include <cstdarg>
#include <cstdio>
#include <fstream>
#include <utility>

namespace {

std::vector<quor::test::SystemLogLine>& written() {
    static std::vector<quor::test::SystemLogLine> lines;
    return lines;
}

std::string& copyPath() {
    static std::string path;
    return path;
}

}  // namespace

namespace quor::test {

void CopySystemLogTo(const std::string& path) {
    copyPath() = path;
}

std::vector<SystemLogLine> TakeSystemLog() {
    return std::exchange(written(), {});
}

std::vector<std::string> TakeSystemLogTexts() {
    std::vector<std::string> texts;
    for (SystemLogLine& line : TakeSystemLog()) {
        texts.push_back(std::move(line.text));
    }
    return texts;
}

}  // namespace quor::test

extern "C" void syslog(int priority, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    char* text = nullptr;
    const int length = vasprintf(&text, format, arguments);
    va_end(arguments);
    if (length >= 0) {
        written().push_back({priority, text});
        if (!copyPath().empty()) {
            std::ofstream(copyPath(), std::ios::app) << text << std::endl;
        }
        free(text);
    }
}
