// Utilities shared by the whole library: the debug sink, string and file helpers, the command parser.
//
// Conventions of every header of this library:
//  - An int result is 0 for success and -1 for failure unless the function says otherwise. Nothing is thrown but the
//    standard library's own exceptions (allocation failure).
//  - Objects and results belong to one thread at a time; the library has no threads and no locks.
//  - A function frees what it allocates before it returns; where something passes to the caller, its comment says so.
#ifndef QUORSYSLOG_COMMON_H
#define QUORSYSLOG_COMMON_H

#include <cstdio>
#include <list>
#include <string>
#include <vector>

namespace Json {
class Value;
}

#pragma GCC visibility push(default)

// The sink of debug messages.
class Debuger {
  public:
    Debuger();
    ~Debuger();

    // Writes `message` to the system log at error priority when `level` is below 1, and drops it otherwise.
    // A "%" in the message is printed as it stands. Safe to call from any thread.
    static void MSG(int level, std::string message);

  private:
    [[maybe_unused]] int level_ = 0;
    std::string label_;
};

// Splits `text` at every character of `delimiters`. Empty fields are kept: n delimiters give n + 1 strings; an empty
// text gives an empty list.
std::list<std::string> Tokenize(const std::string& text, const std::string& delimiters);

// Copies the C string `in` to `out`, putting a backslash before every double quote and backslash and changing nothing
// else, control bytes included. `outSize` counts the terminating zero byte. -1 when a pointer is null, when both are
// the same, or when the result does not fit; `out` is then not terminated and must be discarded.
int EncodeJson(const char* in, char* out, int outSize);

// Collects the lines of an open file from the last to the first. `*lines` receives a new array of `maxLines` pointers
// (null where unused), or null with a line on standard error when there is no memory for it or `maxLines` is negative.
// Entries are stored from index `count` on until the array is full, and `count` advances by one for each. The caller
// frees every string and the array with free(). A file that ends in a newline begins with an empty entry, and so does
// an empty file; lines are cut at 1023 bytes and at a zero byte.
// The result is -1 on every path: judge the outcome by `count`.
int readfileinreverse(FILE* file, char*** lines, int& count, int maxLines);

// The value in plain decimal.
std::string ullNumberToString(unsigned long long value);

// Reads a text that holds several flat JSON objects one after another.
class CmdParser {
  public:
    CmdParser();
    ~CmdParser();

    // Appends one value for each object of `input` to `values`. 1 when every piece parsed, 0 at the first one that did
    // not (reported to the system log; what was appended before it stays). The text is cut after every "}", so an
    // object that holds another one, or a "}" inside a string, does not parse: commands are flat by design.
    int CmdParse(std::string& input, std::vector<Json::Value>& values);
};

#pragma GCC visibility pop

#endif
