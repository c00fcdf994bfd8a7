// Log text is hostile: how it is shown to a person, and how it goes into JSON and CSV.
//
// A byte that is not part of valid UTF-8 is shown as the four characters \xNN wherever text has to be valid.
#ifndef QUORLOG_DISPLAY_H
#define QUORLOG_DISPLAY_H

#include <cstddef>
#include <string>
#include <string_view>

namespace quor::cli {

// True for what a terminal acts upon or hides: control codes, direction marks, invisible and tag characters, line
// separators, and codes that no character has.
bool IsHidden(char32_t code);

// The columns that a character takes on a terminal.
size_t WidthOf(char32_t code);

// Appends the text with everything hidden or invalid spelled out. Returns the columns that it takes on a terminal.
size_t AppendVisible(std::string& out, std::string_view text);
std::string Visible(std::string_view text);

// Appends a JSON string in which everything hidden is written as \uNNNN, so nothing of the text is lost and a terminal
// may receive it.
void AppendVisibleJson(std::string& out, std::string_view text);

// Appends a CSV cell, quoted where needed. With `defuse` a cell that a spreadsheet would take for a formula gets an
// apostrophe in front, and so does one that begins with an apostrophe: dropping one leading apostrophe restores all.
void AppendCsvCell(std::string& out, std::string_view text, bool defuse);

}  // namespace quor::cli

#endif
