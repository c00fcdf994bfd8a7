// Local dates and times in texts.
#ifndef COMMON_LOCALTIME_H
#define COMMON_LOCALTIME_H

#include <array>
#include <cstdint>
#include <ctime>
#include <string>

namespace quor {

// The low 32 bits of Unix seconds in strftime's format; empty when they have no local time.
inline std::string LocalTimeText(int64_t seconds, const char* format) {
    const time_t when = static_cast<int32_t>(seconds);
    const tm* local = localtime(&when);
    std::array<char, 1024> text{};
    return local != nullptr ? std::string(text.data(), strftime(text.data(), text.size(), format, local)) : "";
}

}  // namespace quor

#endif
