#include "base/numbers.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <limits>

namespace quor {
namespace {

struct Magnitude {
    uint64_t value = 0;  // 2^64 - 1 when the digits do not fit
    bool negative = false;
    bool overflow = false;
};

bool isBlank(char c) {
    return c == ' ' || (c >= '\t' && c <= '\r');
}

Magnitude readMagnitude(const char* text) {
    constexpr uint64_t kMax = std::numeric_limits<uint64_t>::max();
    Magnitude number;
    while (isBlank(*text)) {
        ++text;
    }
    if (*text == '-' || *text == '+') {
        number.negative = *text++ == '-';
    }
    for (; *text >= '0' && *text <= '9'; ++text) {
        const auto digit = static_cast<unsigned>(*text - '0');
        number.overflow = number.overflow || number.value > kMax / 10 || number.value * 10 > kMax - digit;
        number.value = number.overflow ? kMax : number.value * 10 + digit;
    }
    return number;
}

}  // namespace

int64_t ToInt64(const char* text) {
    constexpr auto kMax = static_cast<uint64_t>(std::numeric_limits<int64_t>::max());
    const Magnitude number = readMagnitude(OrEmpty(text));
    if (!number.negative) {
        return static_cast<int64_t>(std::min(number.value, kMax));
    }
    return number.value > kMax ? std::numeric_limits<int64_t>::min() : -static_cast<int64_t>(number.value);
}

int32_t ToInt32(const char* text) {
    using Limits = std::numeric_limits<int32_t>;
    return static_cast<int32_t>(std::clamp<int64_t>(ToInt64(text), Limits::min(), Limits::max()));
}

uint64_t ToUint64(const char* text) {
    const Magnitude number = readMagnitude(OrEmpty(text));
    return number.negative && !number.overflow ? 0 - number.value : number.value;
}

std::string Decimal(uint64_t value) {
    std::array<char, 20> digits{};
    const auto end = std::to_chars(digits.data(), digits.data() + digits.size(), value);
    return {digits.data(), end.ptr};
}

std::string WrappedDecimal(int64_t value) {
    return Decimal(static_cast<uint64_t>(value));
}

}  // namespace quor
