#include "base/sectionlines.h"

namespace quor {
namespace {

constexpr std::string_view kBlanks = " \t";
constexpr std::string_view kByteOrderMark = "\xEF\xBB\xBF";

std::string_view trim(std::string_view text) {
    const size_t first = text.find_first_not_of(kBlanks);
    return first == std::string_view::npos ? std::string_view{}
                                           : text.substr(first, text.find_last_not_of(kBlanks) - first + 1);
}

std::string_view withoutLineEnd(std::string_view line) {
    if (!line.empty() && line.back() == '\n') {
        line.remove_suffix(1);
    }
    if (!line.empty() && line.back() == '\r') {
        line.remove_suffix(1);
    }
    return line;
}

bool isComment(std::string_view text) {
    return !text.empty() && (text.front() == '#' || text.front() == ';');
}

// "[name]" and perhaps a comment. A name may hold brackets: it ends at the first one that nothing else follows.
std::string_view headerName(std::string_view text) {
    for (size_t end = text.find(']'); end != std::string_view::npos; end = text.find(']', end + 1)) {
        const std::string_view rest = trim(text.substr(end + 1));
        if (rest.empty() || isComment(rest)) {
            return text.substr(1, end - 1);
        }
    }
    return {};
}

std::string_view unquoted(std::string_view value) {
    const size_t last = value.rfind('"');
    const bool quoted = !value.empty() && value.front() == '"' && last > 0;
    return quoted ? value.substr(1, last - 1) : value;
}

SectionLine parseLine(std::string_view whole, std::string_view text) {
    using Kind = SectionLine::Kind;
    if (text.empty() || isComment(text)) {
        return {whole, Kind::Other, {}, {}};
    }
    if (text.front() == '[') {
        return {whole, Kind::Header, headerName(text), {}};
    }
    const size_t equals = text.find('=');
    const std::string_view key = trim(text.substr(0, equals));
    if (equals == std::string_view::npos || key.empty()) {
        return {whole, Kind::Other, {}, {}};
    }
    return {whole, Kind::Entry, key, unquoted(trim(text.substr(equals + 1)))};
}

}  // namespace

SectionLines ParseSectionLines(std::string_view text) {
    SectionLines lines;
    size_t begin = 0;
    while (begin < text.size()) {
        const size_t newline = text.find('\n', begin);
        const size_t end = newline == std::string_view::npos ? text.size() : newline + 1;
        const std::string_view whole = text.substr(begin, end - begin);
        const bool marked = begin == 0 && whole.substr(0, kByteOrderMark.size()) == kByteOrderMark;
        lines.push_back(parseLine(whole, trim(withoutLineEnd(whole.substr(marked ? kByteOrderMark.size() : 0)))));
        begin = end;
    }
    return lines;
}

std::optional<SectionRange> FindSection(const SectionLines& lines, std::string_view name) {
    const auto isHeader = [&](size_t i) { return lines[i].kind == SectionLine::Kind::Header; };
    size_t header = 0;
    while (header < lines.size() && !(isHeader(header) && lines[header].name == name)) {
        ++header;
    }
    if (header == lines.size() || name.empty()) {
        return std::nullopt;
    }
    size_t end = header + 1;
    while (end < lines.size() && !isHeader(end)) {
        ++end;
    }
    return SectionRange{header, end};
}

std::string WithSection(const std::string& text, std::string_view name, const std::string& section) {
    const SectionLines lines = ParseSectionLines(text);
    const SectionRange range = FindSection(lines, name).value_or(SectionRange{lines.size(), lines.size()});
    std::string changed;
    const auto add = [&changed](std::string_view part) {
        const bool open =
            !part.empty() && !changed.empty() && changed.back() != '\n';  // the last line may lack its end
        changed.append(open ? "\n" : "").append(part);
    };
    for (size_t i = 0; i < lines.size(); ++i) {
        const bool inside = i >= range.header && i < range.end && lines[i].kind != SectionLine::Kind::Other;
        add(i == range.header ? section : inside ? std::string_view() : lines[i].whole);
    }
    add(range.header == lines.size() ? section : std::string_view());
    return changed;
}

}  // namespace quor
