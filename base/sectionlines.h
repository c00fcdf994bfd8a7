// The lines of a section file.
#ifndef BASE_SECTIONLINES_H
#define BASE_SECTIONLINES_H

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace quor {

constexpr size_t kMostSectionBytes = 1U << 20U;  // a longer file is not read

// One line; the views point into the text that was read.
struct SectionLine {
    enum class Kind { Other, Header, Entry };

    std::string_view whole;  // with its line end
    Kind kind = Kind::Other;
    std::string_view name;  // the section's, empty for a broken header; or the key
    std::string_view value;
};

using SectionLines = std::vector<SectionLine>;

// The lines of one section, its header first: [header, end).
struct SectionRange {
    size_t header;
    size_t end;
};

SectionLines ParseSectionLines(std::string_view text);

// The first section of that name.
std::optional<SectionRange> FindSection(const SectionLines& lines, std::string_view name);

// The text with `section` (its header and entries, each line with its end) in place of those of the section `name`, or
// behind everything when there is none; comments stay. An empty `section` removes it.
std::string WithSection(const std::string& text, std::string_view name, const std::string& section);

}  // namespace quor

#endif
