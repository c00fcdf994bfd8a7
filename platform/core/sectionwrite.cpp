#include "platform/core/sectionwrite.h"

#include <algorithm>
#include <unordered_set>

#include "platform/core/sections.h"

namespace quor {
namespace {

// The caller's printf format, which no printf function ever sees: the texts around its two "%s".
struct LineFormat {
    std::string_view before;
    std::string_view between;
    std::string_view after;

    std::string line(const QLIBSZHASH::Entry& entry) const {
        return std::string(before).append(entry.key).append(between).append(entry.value).append(after);
    }
};

// One line with two "%s" and no other "%".
std::optional<LineFormat> parseFormat(std::string_view format) {
    const size_t key = format.find("%s");
    const size_t value = key == std::string_view::npos ? key : format.find("%s", key + 2);
    if (value == std::string_view::npos || std::count(format.begin(), format.end(), '%') != 2 ||
        format.find('\n') != format.size() - 1) {
        return std::nullopt;
    }
    return LineFormat{format.substr(0, key), format.substr(key + 2, value - key - 2), format.substr(value + 2)};
}

class Writer {
  public:
    Writer(const SectionChange& change, const LineFormat& format) : change_(change), format_(format) {}

    std::string append(const std::string& text) {
        text_ = text;
        add("[" + std::string(change_.newName) + "]\n");
        addMissing();
        return std::move(text_);
    }

    // Comments stay where they are and entries that stay keep their places.
    std::string replace(const SectionLines& lines, const SectionRange& range) {
        const size_t last = lastEntry(lines, range);
        for (size_t i = 0; i < lines.size(); ++i) {
            if (i == range.header) {
                addHeader(lines[i]);
            } else if (i > range.header && i < range.end && lines[i].kind == SectionLine::Kind::Entry) {
                addEntry(change_.table.find(lines[i].name));
            } else {
                add(lines[i].whole);
            }
            if (i == last) {
                addMissing();
            }
        }
        return std::move(text_);
    }

  private:
    static size_t lastEntry(const SectionLines& lines, const SectionRange& range) {
        size_t last = range.end - 1;
        while (last > range.header && lines[last].kind != SectionLine::Kind::Entry) {
            --last;
        }
        return last;
    }

    // What was the last line may lack its end.
    void add(std::string_view line) {
        if (!text_.empty() && text_.back() != '\n') {
            text_ += '\n';
        }
        text_ += line;
    }

    void addHeader(const SectionLine& header) {
        const auto offset = static_cast<size_t>(header.name.data() - header.whole.data());
        add(header.whole.substr(0, offset));
        text_.append(change_.newName).append(header.whole.substr(offset + header.name.size()));
    }

    void addEntry(const QLIBSZHASH::Entry* entry) {
        if (entry != nullptr && written_.insert(entry).second) {
            add(format_.line(*entry));
        }
    }

    void addMissing() {
        for (const QLIBSZHASH::Entry& entry : change_.table.entries()) {
            addEntry(&entry);
        }
    }

    const SectionChange& change_;
    const LineFormat& format_;
    std::string text_;
    std::unordered_set<const QLIBSZHASH::Entry*> written_;
};

// Also what keeps a newline, or a key that looks like a comment, from reaching the file.
bool readsBack(const std::string& text, const SectionChange& change) {
    const SectionLines lines = ParseSectionLines(text);
    const std::optional<SectionRange> range = FindSection(lines, change.newName);
    if (!range) {
        return false;
    }
    QLIBSZHASH read;
    ReadSection(lines, *range, read);
    const auto& wanted = change.table.entries();
    return read.entries().size() == wanted.size() && std::all_of(wanted.begin(), wanted.end(), [&](const auto& entry) {
               const QLIBSZHASH::Entry* found = read.find(entry.key);
               return found != nullptr && found->value == entry.value;
           });
}

}  // namespace

std::optional<std::string> ChangeSection(const std::string& text, const SectionChange& change) {
    const std::optional<LineFormat> format = parseFormat(change.lineFormat);
    const SectionLines lines = ParseSectionLines(text);
    const bool taken = change.newName != change.section && FindSection(lines, change.newName);
    if (!format || taken) {
        return std::nullopt;
    }
    Writer writer(change, *format);
    const std::optional<SectionRange> range = FindSection(lines, change.section);
    std::string changed = range ? writer.replace(lines, *range) : writer.append(text);
    if (!readsBack(changed, change)) {
        return std::nullopt;
    }
    return changed;
}

}  // namespace quor
