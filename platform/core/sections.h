// Section files and tables.
#ifndef PLATFORM_CORE_SECTIONS_H
#define PLATFORM_CORE_SECTIONS_H

#include "base/sectionlines.h"
#include "platform/core/table.h"

namespace quor {

// Adds the entries of the section to `table`, of several lines with one key the first.
void ReadSection(const SectionLines& lines, const SectionRange& range, QLIBSZHASH& table);

}  // namespace quor

#endif
