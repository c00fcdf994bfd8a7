#include "platform/archive/trigrams.h"

#include <algorithm>
#include <array>

namespace quor::archive {
namespace {

constexpr uint32_t kMask = 0xffffff;
constexpr size_t kBitsEach = 12;
constexpr uint32_t kHashes = 6;

constexpr std::array<uint8_t, 256> smallLetters() {
    std::array<uint8_t, 256> table{};
    for (size_t i = 0; i < table.size(); ++i) {
        table[i] = static_cast<uint8_t>(i >= 'A' && i <= 'Z' ? i + ('a' - 'A') : i);
    }
    return table;
}

constexpr std::array<uint8_t, 256> kSmall = smallLetters();

uint32_t shifted(uint32_t trigram, char next) {
    return (trigram << 8U | kSmall[static_cast<uint8_t>(next)]) & kMask;
}

// The places of a trigram in a filter.
class Places {
  public:
    Places(uint32_t trigram, size_t bytes) : bits_(uint64_t{bytes} * 8) {
        uint64_t mixed = (uint64_t{trigram} + 1) * 0x9E3779B97F4A7C15U;
        mixed ^= mixed >> 29U;
        mixed *= 0xBF58476D1CE4E5B9U;
        at_ = static_cast<uint32_t>(mixed >> 32U);
        step_ = static_cast<uint32_t>(mixed) | 1U;
    }
    size_t next() {
        at_ += step_;
        return static_cast<size_t>(at_ * bits_ >> 32U);
    }

  private:
    uint64_t bits_;
    uint32_t at_;
    uint32_t step_;
};

// Gathers the trigrams of the literal parts of a pattern.
class Literals {
  public:
    void take(char c) {
        if (static_cast<uint8_t>(c) >= 0x80) {
            cut();
            return;
        }
        last_ = shifted(last_, c);
        if (++length_ >= 3) {
            found_.push_back(last_);
        }
    }
    void cut() { length_ = 0; }
    Trigrams done() {
        std::sort(found_.begin(), found_.end());
        found_.erase(std::unique(found_.begin(), found_.end()), found_.end());
        return std::move(found_);
    }

  private:
    uint32_t last_ = 0;
    size_t length_ = 0;
    Trigrams found_;
};

// Behind the set of characters that begins at `open`.
size_t endOfSet(std::string_view pattern, size_t open) {
    size_t at = open + 1;
    at += at < pattern.size() && pattern[at] == '^' ? 1 : 0;
    const size_t close = pattern.find(']', at + 1);  // one right at the begin is a member
    return close == std::string_view::npos ? pattern.size() : close + 1;
}

bool isSpecial(char c) {
    return c == '*' || c == '?' || c == '[';
}

}  // namespace

TrigramSet::TrigramSet() : seen_((size_t{kMask} + 1) / 64) {}

void TrigramSet::add(std::string_view text) {
    uint32_t trigram = 0;
    size_t length = 0;
    for (const char c : text) {
        trigram = shifted(trigram, c);
        if (++length < 3) {
            continue;
        }
        uint64_t& word = seen_[trigram / 64];
        const uint64_t bit = uint64_t{1} << trigram % 64;
        if ((word & bit) == 0) {
            word |= bit;
            found_.push_back(trigram);
        }
    }
}

std::string TrigramSet::bloom() const {
    std::string bloom(std::max<size_t>(found_.size() * kBitsEach / 8, 8), '\0');
    for (const uint32_t trigram : found_) {
        Places places(trigram, bloom.size());
        for (uint32_t i = 0; i < kHashes; ++i) {
            const size_t place = places.next();
            bloom[place / 8] = static_cast<char>(static_cast<uint8_t>(bloom[place / 8]) | 1U << place % 8);
        }
    }
    return bloom;
}

void TrigramSet::clear() {
    for (const uint32_t trigram : found_) {
        seen_[trigram / 64] = 0;
    }
    found_.clear();
}

bool MayHold(std::string_view bloom, const Trigrams& trigrams) {
    return bloom.empty() || std::all_of(trigrams.begin(), trigrams.end(), [bloom](uint32_t trigram) {
               Places places(trigram, bloom.size());
               bool all = true;
               for (uint32_t i = 0; i < kHashes && all; ++i) {
                   const size_t place = places.next();
                   all = (static_cast<uint8_t>(bloom[place / 8]) >> place % 8 & 1U) != 0;
               }
               return all;
           });
}

// A set of one character is that character: "[[]".
Trigrams TrigramsOfGlob(std::string_view pattern) {
    Literals literals;
    for (size_t at = 0; at < pattern.size();) {
        const size_t end = pattern[at] == '[' ? endOfSet(pattern, at) : at + 1;
        if (!isSpecial(pattern[at])) {
            literals.take(pattern[at]);
        } else if (end == at + 3 && pattern[at + 1] != '^' && pattern[end - 1] == ']') {
            literals.take(pattern[at + 1]);
        } else {
            literals.cut();
        }
        at = end;
    }
    return literals.done();
}

Trigrams TrigramsOfLike(std::string_view pattern) {
    Literals literals;
    for (const char c : pattern) {
        if (c == '%' || c == '_') {
            literals.cut();
        } else {
            literals.take(c);
        }
    }
    return literals.done();
}

std::string TextOfGlob(std::string_view pattern) {
    if (pattern.size() < 3 || pattern.front() != '*' || pattern.back() != '*') {
        return {};
    }
    const std::string_view text = pattern.substr(1, pattern.size() - 2);
    const bool plain =
        std::none_of(text.begin(), text.end(), [](char c) { return isSpecial(c) || static_cast<uint8_t>(c) >= 0x80; });
    return plain ? std::string(text) : std::string();
}

}  // namespace quor::archive
