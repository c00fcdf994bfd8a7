#include "support/system_log.h"

#include <cstdarg>
#include <cstdio>
#include <utility>

namespace {

std::vector<quor::test::SystemLogLine>& written() {
    static std::vector<quor::test::SystemLogLine> lines;
    return lines;
}

}  // namespace

namespace quor::test {

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
        free(text);
    }
}
