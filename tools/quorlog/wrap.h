// Text in lines that fit a screen.
#ifndef QUORLOG_WRAP_H
#define QUORLOG_WRAP_H

#include <string>
#include <string_view>
#include <vector>

namespace quor::cli {

// Breaks text that is harmless and visible at its blanks, and a word longer than a line inside, into lines of at most
// `width` columns. The lines are parts of `text`, without the blanks between them.
std::vector<std::string_view> Wrap(std::string_view text, size_t width);

// Appends the lines of Wrap(), each but the first behind a line break and `indent` blanks.
void AppendWrapped(std::string& out, std::string_view text, size_t width, size_t indent);

}  // namespace quor::cli

#endif
