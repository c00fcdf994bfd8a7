// Numbers as text and back, base 10, independent of locale and of the width of long.
#ifndef BASE_NUMBERS_H
#define BASE_NUMBERS_H

#include <cstdint>
#include <string>

namespace quor {

// Text to number, one rule for every width: leading white space, an optional sign, then digits up to the first other
// character. No digits give 0; a value out of range saturates. Null counts as the empty text.
int32_t ToInt32(const char* text);
int64_t ToInt64(const char* text);
// A minus sign negates modulo 2^64, as strtoull does.
uint64_t ToUint64(const char* text);

// The value in plain decimal.
std::string Decimal(uint64_t value);
// The same of a signed value, as this library writes those: a negative one becomes the unsigned one of the same 64
// bits.
std::string WrappedDecimal(int64_t value);

// A field that may be null, as text.
inline const char* OrEmpty(const char* text) {
    return text != nullptr ? text : "";
}

}  // namespace quor

#endif
