#include "tools/quorlog/wrap.h"

#include "base/utf8.h"
#include "tools/quorlog/display.h"

namespace quor::cli {
namespace {

// The line that is being filled: where it begins and how wide it is, and the same up to its last blank.
struct Filling {
    size_t begin = 0;
    size_t width = 0;
    size_t blank = 0;
    size_t widthOfWord = 0;  // behind that blank
};

// The end of the line, whose next character, at `at`, has no room.
size_t endOf(const Filling& line, size_t at) {
    return line.blank > line.begin ? line.blank : at;
}

std::string_view withoutBlanksBehind(std::string_view line) {
    return line.substr(0, line.find_last_not_of(' ') + 1);
}

}  // namespace

std::vector<std::string_view> Wrap(std::string_view text, size_t width) {
    std::vector<std::string_view> lines;
    Filling line;
    for (size_t at = 0; at < text.size();) {
        const Symbol symbol = NextSymbol(text, at);
        const size_t needed = WidthOf(symbol.code);
        const bool blank = symbol.code == ' ';
        if (!blank && line.width + needed > width && at > line.begin) {
            const size_t end = endOf(line, at);
            lines.push_back(withoutBlanksBehind(text.substr(line.begin, end - line.begin)));
            line.width = end == at ? 0 : line.widthOfWord;
            line.begin = line.blank = end == at ? at : end + 1;
        }
        at += symbol.length;
        line.width += needed;
        line.widthOfWord = blank ? 0 : line.widthOfWord + needed;
        line.blank = blank ? at - symbol.length : line.blank;
    }
    lines.push_back(withoutBlanksBehind(text.substr(line.begin)));
    return lines;
}

void AppendWrapped(std::string& out, std::string_view text, size_t width, size_t indent) {
    bool first = true;
    for (const std::string_view line : Wrap(text, width)) {
        if (!first) {
            out.append("\n").append(indent, ' ');
        }
        out += line;
        first = false;
    }
}

}  // namespace quor::cli
