#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <unordered_set>

#include "base/guarded.h"
#include "base/textfile.h"
#include "platform/core/sections.h"
#include "platform/core/sectionwrite.h"
#include "quor/quorcore.h"

namespace {

bool readFile(const char* file, std::string& text) {
    return quor::ReadTextFile(file, quor::kMostSectionBytes, text) == quor::ReadOutcome::Done;
}

std::vector<std::string_view> sectionNames(const quor::SectionLines& lines) {
    std::vector<std::string_view> names;
    std::unordered_set<std::string_view> seen;
    for (const quor::SectionLine& line : lines) {
        if (line.kind == quor::SectionLine::Kind::Header && !line.name.empty() && seen.insert(line.name).second) {
            names.push_back(line.name);
        }
    }
    return names;
}

int appendAll(QLIBSZLIST& list, const std::vector<std::string_view>& names) {
    const size_t wanted = static_cast<size_t>(list.count) + names.size();
    auto* items = static_cast<char**>(realloc(list.items, std::max<size_t>(wanted, 1) * sizeof(char*)));
    if (items == nullptr) {
        return -1;
    }
    list.items = items;
    for (const std::string_view name : names) {
        char* const copy = strndup(name.data(), name.size());
        if (copy == nullptr) {
            return -1;
        }
        list.items[list.count++] = copy;
    }
    return 0;
}

int getSection(const char* file, const char* section, QLIBSZHASH& table) {
    std::string text;
    if (!readFile(file, text)) {
        return -1;
    }
    const quor::SectionLines lines = quor::ParseSectionLines(text);
    const auto range = quor::FindSection(lines, section);
    if (!range) {
        return -1;
    }
    QLIBSZHASH read;
    quor::ReadSection(lines, *range, read);
    for (const auto& entry : read.entries()) {
        table.set(entry.key, entry.value);
    }
    return 0;
}

int setSection(const char* file, const quor::SectionChange& change) {
    std::string text;
    if (quor::ReadTextFile(file, quor::kMostSectionBytes, text) == quor::ReadOutcome::Failed) {
        return -1;
    }
    const std::optional<std::string> changed = quor::ChangeSection(text, change);
    const bool fits = changed && changed->size() <= quor::kMostSectionBytes;
    return fits && quor::ReplaceTextFile(file, *changed) ? 0 : -1;
}

int getKeyValue(const char* file, const char* key, char* out, size_t outSize) {
    std::string text;
    if (!readFile(file, text)) {
        return -1;
    }
    const quor::SectionLines lines = quor::ParseSectionLines(text);
    const auto found = std::find_if(lines.begin(), lines.end(), [key](const quor::SectionLine& line) {
        return line.kind == quor::SectionLine::Kind::Entry && line.name == key;
    });
    if (found == lines.end()) {
        return -1;
    }
    out[found->value.copy(out, outSize - 1)] = '\0';
    return 0;
}

}  // namespace

int QLIBCFileEnumSection(const char* file, QLIBSZLIST** list) {
    if (quor::AnyNull(file, list) || *list == nullptr || (*list)->count < 0) {
        return -1;
    }
    return quor::Guarded([&] {
        std::string text;
        return readFile(file, text) ? appendAll(**list, sectionNames(quor::ParseSectionLines(text))) : -1;
    });
}

int QLIBCFileGetSection(const char* file, const char* section, QLIBSZHASH** hash) {
    if (quor::AnyNull(file, section, hash) || *hash == nullptr) {
        return -1;
    }
    return quor::Guarded([&] { return getSection(file, section, **hash); });
}

int QLIBCFileSetSection(const char* file, const char* section, const char* newName, QLIBSZHASH* hash,
                        const char* lineFormat) {
    if (quor::AnyNull(file, section, newName, hash, lineFormat)) {
        return -1;
    }
    return quor::Guarded([&] { return setSection(file, {section, newName, *hash, lineFormat}); });
}

int QLIBCFileGetKeyValue(const char* file, const char* key, char* out, int outSize, int /*flags*/) {
    if (quor::AnyNull(file, key, out) || outSize < 1) {
        return -1;
    }
    return quor::Guarded([&] { return getKeyValue(file, key, out, static_cast<size_t>(outSize)); });
}
