// Numbers and texts of the archive format, the same on every machine: written at the end of a string, read from the
// front of a view with every length checked.
#ifndef PLATFORM_ARCHIVE_BYTES_H
#define PLATFORM_ARCHIVE_BYTES_H

#include <cstdint>
#include <stdexcept>
#include <string>
#include <string_view>

namespace quor::archive {

// What was read cannot be what was written.
class Damaged : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

inline void Demand(bool holds, const char* otherwise) {
    if (!holds) {
        throw Damaged(otherwise);
    }
}

void PutByte(std::string& out, uint8_t byte);
// Seven bits a byte, the lowest first.
void PutNumber(std::string& out, uint64_t number);
// The same, with the sign in the lowest bit.
void PutSigned(std::string& out, int64_t number);
// Eight bytes, the lowest first.
void PutFixed(std::string& out, uint64_t number);

// Throws Damaged when there is not enough left.
class Bytes {
  public:
    explicit Bytes(std::string_view bytes) : left_(bytes) {}

    std::string_view left() const { return left_; }
    uint8_t byte();
    uint64_t number();
    int64_t signedNumber();
    uint64_t fixed();
    std::string_view take(uint64_t size);
    // A number that must not be larger than `most`.
    uint64_t numberUpTo(uint64_t most);

  private:
    std::string_view left_;
};

uint64_t Checksum(std::string_view bytes);

}  // namespace quor::archive

#endif
