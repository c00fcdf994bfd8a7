// Which three bytes follow each other in the texts of a block, so that a search can leave out blocks without its word.
// Capital letters count as small ones (ASCII).
#ifndef PLATFORM_ARCHIVE_TRIGRAMS_H
#define PLATFORM_ARCHIVE_TRIGRAMS_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace quor::archive {

// The three bytes as one number, the first the highest.
using Trigrams = std::vector<uint32_t>;

// Gathers those of many texts, each once.
class TrigramSet {
  public:
    TrigramSet();
    void add(std::string_view text);
    // A Bloom filter of them.
    std::string bloom() const;
    void clear();

  private:
    std::vector<uint64_t> seen_;  // a bit for each
    Trigrams found_;
};

// Whether a filter may have been made of all of these; true when in doubt.
bool MayHold(std::string_view bloom, const Trigrams& trigrams);

// Those that every text must have that the pattern of GLOB or LIKE (without ESCAPE) matches. Bytes outside of ASCII are
// left out: SQLite takes some different ones for the same character.
Trigrams TrigramsOfGlob(std::string_view pattern);
Trigrams TrigramsOfLike(std::string_view pattern);

// The text that a GLOB pattern looks for anywhere; empty for any other pattern.
std::string TextOfGlob(std::string_view pattern);

}  // namespace quor::archive

#endif
