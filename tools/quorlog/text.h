// Log text is hostile: how it is shown to a person, and how it goes into JSON and CSV.
//
// A byte that is not part of valid UTF-8 is shown as the four characters \xNN wherever text has to be valid.
#ifndef QUORLOG_TEXT_H
#define QUORLOG_TEXT_H

#include <cstddef>
#include <string>
#include <string_view>

namespace quor::cli {

struct Symbol {
    char32_t code;  // the byte itself when it is not valid
    size_t length;  // bytes
    bool valid;
};

// The symbol that begins at `at`, which is inside the text. Overlong forms, surrogates and values above U+10FFFF are
// not valid.
Symbol NextSymbol(std::string_view text, size_t at);

// Columns that a terminal gives to the symbol: 0 for combining marks, 2 for wide ones, else 1.
size_t SymbolWidth(char32_t code);

// True for what a terminal acts upon or hides: control codes, direction marks, invisible and tag characters.
bool IsHidden(char32_t code);

// Appends the text with everything hidden or invalid spelled out. Returns the columns it takes.
size_t AppendVisible(std::string& out, std::string_view text);
std::string Visible(std::string_view text);

// Appends a JSON string with its quotes. Hidden characters are written as \uNNNN, so nothing of the text is lost and a
// terminal may receive it.
void AppendJsonString(std::string& out, std::string_view text);

// Appends a CSV cell, quoted where needed. With `defuse` a cell that a spreadsheet would take for a formula gets an
// apostrophe in front, and so does one that begins with an apostrophe: dropping one leading apostrophe restores all.
void AppendCsvCell(std::string& out, std::string_view text, bool defuse);

}  // namespace quor::cli

#endif
