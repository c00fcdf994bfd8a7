#include "platform/core/sections.h"

namespace quor {

void ReadSection(const SectionLines& lines, const SectionRange& range, QLIBSZHASH& table) {
    for (size_t i = range.header + 1; i < range.end; ++i) {
        const SectionLine& line = lines[i];
        if (line.kind == SectionLine::Kind::Entry && table.find(line.name) == nullptr) {
            table.set(line.name, line.value);
        }
    }
}

}  // namespace quor
