// Where the cells of a table stand: beside each other, and on a screen too narrow for that, below.
#ifndef QUORLOG_LAYOUT_H
#define QUORLOG_LAYOUT_H

#include <cstddef>
#include <string>
#include <vector>

#include "tools/quorlog/output.h"

namespace quor::cli {

struct Cell {
    std::string text;  // harmless and visible
    size_t width = 0;
    const char* color = "";
};
using Line = std::vector<Cell>;

class Layout {
  public:
    // `screen`: the width of the terminal, or 0 for lines of any length.
    Layout(const Columns& columns, size_t screen);

    // Lets the columns be as wide as this row's cells, up to a bound: a long cell stands out instead of widening every
    // row.
    void widen(const Line& line);
    // Appends the row. What the screen has no room for wraps at words; the columns behind it go to a line of their own.
    void append(std::string& out, const Line& line) const;

  private:
    size_t needOf(size_t column) const;
    size_t place(std::string& out, const Cell& cell, size_t column, size_t start) const;

    const Columns& columns_;
    size_t screen_;
    size_t indent_;
    std::vector<size_t> widths_;
};

}  // namespace quor::cli

#endif
