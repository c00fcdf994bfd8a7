// A section file's text with one section written anew.
#ifndef PLATFORM_CORE_SECTIONWRITE_H
#define PLATFORM_CORE_SECTIONWRITE_H

#include <optional>
#include <string>
#include <string_view>

#include "platform/core/table.h"

namespace quor {

struct SectionChange {
    std::string_view section;
    std::string_view newName;
    const QLIBSZHASH& table;
    std::string_view lineFormat;
};

// Nothing when the result would not read back as `change.table` and everything else as it was.
std::optional<std::string> ChangeSection(const std::string& text, const SectionChange& change);

}  // namespace quor

#endif
