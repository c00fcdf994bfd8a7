// The system log of the test program: lines are kept, not written.
#ifndef TESTS_SUPPORT_SYSTEM_LOG_H
#define TESTS_SUPPORT_SYSTEM_LOG_H

#include <string>
#include <vector>

namespace quor::test {

struct SystemLogLine {
    int priority;
    std::string text;
};

// Everything written since the last call.
std::vector<SystemLogLine> TakeSystemLog();

// The texts alone.
std::vector<std::string> TakeSystemLogTexts();

// Lines written from now on also go to this file, which shows those of forked processes; empty ends it.
void CopySystemLogTo(const std::string& path);

}  // namespace quor::test

#endif
