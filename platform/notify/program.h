// A program that is not ours, run within bounds.
#ifndef PLATFORM_NOTIFY_PROGRAM_H
#define PLATFORM_NOTIFY_PROGRAM_H

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "base/guards.h"

namespace quor::notify {

struct ProgramEnd {
    bool inTime = true;  // false: it was ended when its time was over
    int status = 0;      // as waitpid() tells it
    std::string output;  // how what it printed begins
};

// Runs it without arguments, in the folder "/", with `environment` alone and `input` as its standard input. It is ended
// after `seconds`, and whatever it started ends with it. Nothing, with the cause in errno, when it cannot be started.
std::optional<ProgramEnd> RunProgram(const std::string& path, const std::vector<std::string>& environment, int input,
                                     int32_t seconds);

}  // namespace quor::notify

#endif
