// The words of a text.
#ifndef BASE_WORDS_H
#define BASE_WORDS_H

#include <algorithm>
#include <string_view>

namespace quor {

// Hands every maximal run of characters that are none of `separators` to `take(std::string_view)`.
template <typename Take>
void EachWord(std::string_view text, std::string_view separators, Take&& take) {
    for (size_t end = 0, begin = text.find_first_not_of(separators); begin != std::string_view::npos;
         begin = text.find_first_not_of(separators, end)) {
        end = std::min(text.find_first_of(separators, begin), text.size());
        take(text.substr(begin, end - begin));
    }
}

}  // namespace quor

#endif
