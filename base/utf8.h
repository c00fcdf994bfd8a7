// The one reader of UTF-8.
#ifndef BASE_UTF8_H
#define BASE_UTF8_H

#include <cstddef>
#include <string_view>

namespace quor {

struct Symbol {
    char32_t code;  // the byte itself when it is not valid
    size_t length;  // bytes
    bool valid;
};

// The symbol that begins at `at`, which is inside the text. Overlong forms, surrogates and values above U+10FFFF are
// not valid: their bytes are symbols of their own.
Symbol NextSymbol(std::string_view text, size_t at);

bool IsUtf8(std::string_view text);

}  // namespace quor

#endif
