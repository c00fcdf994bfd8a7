#include "platform/archive/bytes.h"

#include <xxhash.h>

namespace quor::archive {

void PutByte(std::string& out, uint8_t byte) {
    out.push_back(static_cast<char>(byte));
}

void PutNumber(std::string& out, uint64_t number) {
    for (; number >= 0x80; number >>= 7U) {
        PutByte(out, static_cast<uint8_t>(number | 0x80U));
    }
    PutByte(out, static_cast<uint8_t>(number));
}

void PutSigned(std::string& out, int64_t number) {
    const auto bits = static_cast<uint64_t>(number);
    PutNumber(out, number < 0 ? ~(bits << 1U) : bits << 1U);
}

void PutFixed(std::string& out, uint64_t number) {
    for (int i = 0; i < 8; ++i, number >>= 8U) {
        PutByte(out, static_cast<uint8_t>(number));
    }
}

uint8_t Bytes::byte() {
    return static_cast<uint8_t>(take(1)[0]);
}

uint64_t Bytes::number() {
    uint64_t number = 0;
    for (unsigned shift = 0; shift < 64; shift += 7) {
        const uint8_t next = byte();
        number |= static_cast<uint64_t>(next & 0x7fU) << shift;
        if (next < 0x80) {
            return number;
        }
    }
    throw Damaged("a number without an end");
}

int64_t Bytes::signedNumber() {
    const uint64_t bits = number();
    return static_cast<int64_t>((bits & 1U) != 0 ? ~(bits >> 1U) : bits >> 1U);
}

uint64_t Bytes::fixed() {
    const std::string_view bytes = take(8);
    uint64_t number = 0;
    for (size_t i = 8; i-- > 0;) {
        number = number << 8U | static_cast<uint8_t>(bytes[i]);
    }
    return number;
}

std::string_view Bytes::take(uint64_t size) {
    Demand(size <= left_.size(), "it ends too early");
    const std::string_view taken = left_.substr(0, static_cast<size_t>(size));
    left_.remove_prefix(taken.size());
    return taken;
}

uint64_t Bytes::numberUpTo(uint64_t most) {
    const uint64_t value = number();
    Demand(value <= most, "a number is too large");
    return value;
}

uint64_t Checksum(std::string_view bytes) {
    return XXH3_64bits(bytes.data(), bytes.size());
}

}  // namespace quor::archive
