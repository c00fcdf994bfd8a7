// Rows to standard output, in the form that was asked for.
#ifndef QUORLOG_OUTPUT_H
#define QUORLOG_OUTPUT_H

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "store/columns.h"
#include "tools/quorlog/pager.h"

namespace quor::cli {

enum class Format { Table, Json, Csv, Ndjson };
constexpr std::array<const char*, 4> kFormatNames = {"table", "json", "csv", "ndjson"};  // by Format

struct Style {
    Format format = Format::Table;
    bool safeCsv = false;   // defuse what a spreadsheet takes for a formula
    bool terminal = false;  // a terminal reads: nothing raw may reach it
    bool color = false;
    size_t width = 0;  // of the terminal; 0 for any
    size_t height = 0;
    std::vector<std::string> pager;  // the command that shows what is longer than the terminal, or none
};

// A bar as long, of the longest that suits the terminal, as `part` is of `most`.
std::string Bar(const Style& style, uint64_t part, uint64_t most);

// The person has left the pager: nobody waits for the rest.
struct ReaderLeft {};

// Buffered writing to a file descriptor. A failed write throws Failure.
class Output {
  public:
    explicit Output(int fd) : fd_(fd) {}
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;

    // Lets the style's pager show what is longer than its screen. Then a write throws ReaderLeft as soon as it is left,
    // and the end of this object waits for that.
    void page(const Style& style) { screen_ = style; }

    // What is appended here is written by the next drain() or flush().
    std::string& buffer() { return buffer_; }
    // Writes when a good deal has gathered.
    void drain() {
        if (buffer_.size() >= kFull) {
            flush();
        }
    }
    void flush();

  private:
    static constexpr size_t kFull = size_t{64} * 1024;

    void choose();

    std::string buffer_;
    int fd_;
    Style screen_;  // without a pager once it is decided
    std::optional<Pager> pager_;
};

using store::Kind;

struct Column {
    const char* name;
    Kind kind = Kind::Text;
};

using Columns = std::vector<Column>;
using Cells = std::vector<std::string_view>;

// Takes one row after another; every row has as many cells as there are columns.
class RowSink {
  public:
    RowSink(const RowSink&) = delete;
    RowSink& operator=(const RowSink&) = delete;
    virtual ~RowSink() = default;

    virtual void row(const Cells& cells) = 0;
    // Says that rows were left out here.
    virtual void gap() {}
    // Lets the reader see the rows so far.
    virtual void flush() { out_.flush(); }
    // Ends the output; no row follows.
    virtual void finish() { flush(); }

  protected:
    RowSink(Columns columns, Output& out) : columns_(std::move(columns)), out_(out) {}

    const Columns columns_;
    Output& out_;
};

std::unique_ptr<RowSink> MakeSink(const Style& style, Columns columns, Output& out);
// The aligned table, as MakeSink() makes it. A table of one column has no heading.
std::unique_ptr<RowSink> MakeTable(const Style& style, Columns columns, Output& out);

// One thing with named values: a table shows them below each other, the other forms as one row.
struct Value {
    const char* name;
    std::string text;
    Kind kind = Kind::Text;
};
void WriteRecord(const Style& style, const std::vector<Value>& values, Output& out);

}  // namespace quor::cli

#endif
