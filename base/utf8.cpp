#include "base/utf8.h"

#include <cstdint>

namespace quor {
namespace {

// How the lead byte of a sequence of two to four bytes begins it, and the smallest value that needs that length.
struct Lead {
    uint8_t mask;
    uint8_t bits;
    char32_t smallest;
};

constexpr Lead kLeads[] = {{0xE0, 0xC0, 0x80}, {0xF0, 0xE0, 0x800}, {0xF8, 0xF0, 0x10000}};

bool isContinuation(uint8_t byte) {
    return (byte & 0xC0U) == 0x80;
}

bool isScalar(char32_t code) {
    return code <= 0x10FFFF && (code < 0xD800 || code > 0xDFFF);
}

}  // namespace

Symbol NextSymbol(std::string_view text, size_t at) {
    const auto byteAt = [&](size_t i) { return static_cast<uint8_t>(text[i]); };
    const uint8_t first = byteAt(at);
    const Symbol single{first, 1, first < 0x80};
    size_t length = 2;
    for (const Lead& lead : kLeads) {
        if ((first & lead.mask) != lead.bits) {
            ++length;
            continue;
        }
        char32_t code = first & static_cast<uint8_t>(~lead.mask);
        for (size_t i = 1; i < length; ++i) {
            if (at + i >= text.size() || !isContinuation(byteAt(at + i))) {
                return single;
            }
            code = (code << 6U) | (byteAt(at + i) & 0x3FU);
        }
        return code >= lead.smallest && isScalar(code) ? Symbol{code, length, true} : single;
    }
    return single;
}

bool IsUtf8(std::string_view text) {
    for (size_t at = 0; at < text.size();) {
        const Symbol symbol = NextSymbol(text, at);
        if (!symbol.valid) {
            return false;
        }
        at += symbol.length;
    }
    return true;
}

}  // namespace quor
