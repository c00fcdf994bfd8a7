// The lines of a section file.
#ifndef PLATFORM_CORE_SECTIONS_H
#define PLATFORM_CORE_SECTIONS_H

#include <cstddef>
#include <optional>
#include <string_view>
#include <vector>

#include "platform/core/table.h"

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

// Adds the entries of the section to `table`, of several lines with one key the first.
void ReadSection(const SectionLines& lines, const SectionRange& range, QLIBSZHASH& table);

}  // namespace quor

#endif
