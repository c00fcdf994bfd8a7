// Text as a JSON string.
#ifndef BASE_JSON_H
#define BASE_JSON_H

#include <cstdint>
#include <string>
#include <string_view>

namespace quor {

// Appends the text in quotes, as valid JSON whatever bytes it holds: control characters, and the codes that `isHidden`
// picks, are written as escapes; a byte that is not part of valid UTF-8 as the four characters \xNN.
void AppendJsonString(std::string& out, std::string_view text, bool (*isHidden)(char32_t code) = nullptr);

std::string JsonString(std::string_view text);

// Appends the lowest `digits` hexadecimal digits of a value.
void AppendHex(std::string& out, uint32_t value, int digits);

}  // namespace quor

#endif
