#include "tools/quorlog/layout.h"

#include <algorithm>
#include <cstdint>

#include "tools/quorlog/wrap.h"

namespace quor::cli {
namespace {

constexpr size_t kMaxWidth = 40;
constexpr size_t kGap = 2;
constexpr size_t kIndent = 4;
constexpr size_t kNarrowest = 12;  // a screen said to be narrower is taken for this wide
constexpr size_t kLeast = 24;      // columns worth wrapping the last cell in
constexpr char kReset[] = "\033[0m";

// Blanks at the end of a line, and lines of nothing, show only when they are copied.
void trim(std::string& out, size_t begin, const char* what) {
    const size_t last = out.find_last_not_of(what);
    out.resize(last == std::string::npos ? begin : std::max(begin, last + 1));
}

}  // namespace

Layout::Layout(const Columns& columns, size_t screen)
    : columns_(columns), screen_(screen == 0 ? SIZE_MAX : std::max(screen, kNarrowest)),
      indent_(std::min(kIndent, screen_ / 8)), widths_(columns.size(), 0) {}

void Layout::widen(const Line& line) {
    for (size_t i = 0; i < line.size(); ++i) {
        widths_[i] = std::max(widths_[i], std::min(line[i].width, kMaxWidth));
    }
}

// The room without which a column goes to the next line.
size_t Layout::needOf(size_t column) const {
    const bool last = column + 1 == columns_.size();
    return std::min({widths_[column], last ? std::max(screen_ / 3, kLeast) : SIZE_MAX, screen_ - indent_});
}

void Layout::append(std::string& out, const Line& line) const {
    const size_t begin = out.size();
    size_t reached = 0;
    for (size_t i = 0; i < line.size(); ++i) {
        size_t start = i == 0 ? 0 : reached + kGap;
        if (i != 0 && start + needOf(i) > screen_) {
            trim(out, begin, " ");
            out += '\n';
            start = indent_;
            reached = 0;
        }
        out.append(start - reached, ' ');
        reached = place(out, line[i], i, start);
    }
    trim(out, begin, " \n");
    out += '\n';
}

// Returns the column behind the cell.
size_t Layout::place(std::string& out, const Cell& cell, size_t column, size_t start) const {
    const size_t room = screen_ - start;
    const size_t width = std::min(widths_[column], room);
    const size_t padding = width - std::min(cell.width, width);
    const bool right = columns_[column].kind == Kind::Number;
    out.append(right ? padding : 0, ' ');
    out += cell.color;
    if (cell.width > room) {
        AppendWrapped(out, cell.text, room, start);
    } else {
        out += cell.text;
    }
    out += *cell.color != '\0' ? kReset : "";
    out.append(right ? 0 : padding, ' ');
    return cell.width > room ? screen_ : start + std::max(cell.width, width);
}

}  // namespace quor::cli
