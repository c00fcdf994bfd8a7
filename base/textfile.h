// Small text files, read whole and replaced whole.
#ifndef BASE_TEXTFILE_H
#define BASE_TEXTFILE_H

#include <cstddef>
#include <string>

namespace quor {

enum class ReadOutcome { Done, Missing, Failed };

// Reads a regular file. It fails on anything else (a FIFO does not hang it), on one longer than `limit`, and on a zero
// byte: `text` is then untouched.
ReadOutcome ReadTextFile(const std::string& path, size_t limit, std::string& text);

// Puts `text` in place of the file, or creates it with mode 0644. Whatever happens, the file holds its old or its new
// text. Owner and mode stay; a symbolic link stays and what it leads to is replaced.
bool ReplaceTextFile(const std::string& path, const std::string& text);

}  // namespace quor

#endif
