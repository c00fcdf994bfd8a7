// Text to number, base 10, one rule for every width: leading white space, an optional sign, then digits up to the first
// other character. No digits give 0; a value out of range saturates. Independent of locale and of the width of long.
#ifndef COMMON_NUMBERS_H
#define COMMON_NUMBERS_H

#include <cstdint>

namespace quor {

// Null counts as the empty text.
int32_t ToInt32(const char* text);
int64_t ToInt64(const char* text);
// A minus sign negates modulo 2^64, as strtoull does.
uint64_t ToUint64(const char* text);

// A field that may be null, as text.
inline const char* OrEmpty(const char* text) {
    return text != nullptr ? text : "";
}

}  // namespace quor

#endif
