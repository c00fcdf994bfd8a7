#include "tests/support/system_log.h"

#include <cstdarg>
#include <cstdio>
#include <fstream>
#include <new>
#include <utility>

#include "common/handles.h"

namespace {

std::vector<quor::test::SystemLogLine> written;
std::string copyPath;

}  // namespace

namespace quor::test {

void CopySystemLogTo(const std::string& path) {
    copyPath = path;
}

std::vector<SystemLogLine> TakeSystemLog() {
    return std::exchange(written, {});
}

std::vector<std::string> TakeSystemLogTexts() {
    std::vector<std::string> texts;
    for (SystemLogLine& line : TakeSystemLog()) {
        texts.push_back(std::move(line.text));
    }
    return texts;
}

}  // namespace quor::test

// Like the real one it never fails: without memory the line is lost.
extern "C" void syslog(int priority, const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    char* raw = nullptr;
    const int length = vasprintf(&raw, format, arguments);
    va_end(arguments);
    const quor::CText text(length >= 0 ? raw : nullptr);
    try {
        written.push_back({priority, text != nullptr ? text.get() : format});
        if (!copyPath.empty()) {
            std::ofstream(copyPath, std::ios::app) << text.get() << std::endl;
        }
    } catch (const std::bad_alloc&) {
        return;
    }
}
