#include "tools/quorlog/output.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <utility>

#include "base/files.h"
#include "store/failure.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/wrap.h"

namespace quor::cli {
namespace {

// An object of one row.
void appendObject(std::string& out, const Columns& columns, const Cells& cells) {
    char separator = '{';
    for (size_t i = 0; i < columns.size(); ++i) {
        out += separator;
        separator = ',';
        out += '"';
        out += columns[i].name;
        out += "\":";
        if (columns[i].kind == Kind::Number || columns[i].kind == Kind::Truth) {
            out += cells[i].empty() ? "null" : cells[i];
        } else {
            AppendVisibleJson(out, cells[i]);
        }
    }
    out += '}';
}

class NdjsonSink : public RowSink {
  public:
    NdjsonSink(Columns columns, Output& out) : RowSink(std::move(columns), out) {}

    void row(const Cells& cells) override {
        appendObject(out_.buffer(), columns_, cells);
        out_.buffer() += '\n';
        out_.drain();
    }
};

class JsonSink : public RowSink {
  public:
    JsonSink(Columns columns, Output& out) : RowSink(std::move(columns), out) {}

    void row(const Cells& cells) override {
        out_.buffer() += empty_ ? "[" : ",\n";
        empty_ = false;
        appendObject(out_.buffer(), columns_, cells);
        out_.drain();
    }

    void finish() override {
        out_.buffer() += empty_ ? "[]\n" : "]\n";
        flush();
    }

  private:
    bool empty_ = true;
};

class CsvSink : public RowSink {
  public:
    CsvSink(const Style& style, Columns columns, Output& out) : RowSink(std::move(columns), out), style_(style) {
        Cells names;
        for (const Column& column : columns_) {
            names.emplace_back(column.name);
        }
        CsvSink::row(names);
    }

    void row(const Cells& cells) override {
        for (size_t i = 0; i < cells.size(); ++i) {
            out_.buffer() += i == 0 ? "" : ",";
            append(cells[i], columns_[i].kind);
        }
        out_.buffer() += "\r\n";
        out_.drain();
    }

  private:
    void append(std::string_view cell, Kind kind) {
        visible_.clear();
        if (style_.terminal) {
            AppendVisible(visible_, cell);
            cell = visible_;
        }
        AppendCsvCell(out_.buffer(), cell, style_.safeCsv && kind != Kind::Number);
    }

    Style style_;
    std::string visible_;
};

void writeBelowEachOther(const std::vector<Value>& values, size_t screen, Output& out) {
    size_t width = 0;
    for (const Value& value : values) {
        width = std::max(width, strlen(value.name) + 2);
    }
    for (const Value& value : values) {
        const std::string text = Visible(value.text);
        std::string& line = out.buffer().append(value.name);
        line.append(text.empty() ? 0 : width - strlen(value.name), ' ');
        AppendWrapped(line, text, screen > 2 * width ? screen - width : SIZE_MAX, width);
        line += '\n';
    }
    out.flush();
}

// Whether the text takes more lines than there are above the prompt.
bool isLonger(const std::string& text, const Style& screen) {
    const auto lines = static_cast<size_t>(std::count(text.begin(), text.end(), '\n'));
    return std::max(lines, text.size() / std::max<size_t>(screen.width, 1)) >= screen.height;
}

}  // namespace

std::string Bar(const Style& style, uint64_t part, uint64_t most) {
    constexpr size_t kLongest = 40;
    const auto longest = static_cast<double>(std::clamp<size_t>(style.width / 3, 1, kLongest));
    const double share = most == 0 ? 0 : static_cast<double>(part) / static_cast<double>(most);
    std::string bar;
    return bar.append(std::max<size_t>(part != 0 ? 1 : 0, static_cast<size_t>(longest * share)), '#');
}

// Between a terminal and a pager, as soon as there is something to show.
void Output::choose() {
    if (!screen_.pager.empty() && !buffer_.empty()) {
        const std::vector<std::string> command = std::exchange(screen_.pager, {});
        if (isLonger(buffer_, screen_)) {
            fd_ = pager_.emplace(command).input();
        }
    }
}

void Output::flush() {
    choose();
    const bool written = WriteAll(fd_, buffer_);
    const std::string cause = strerror(errno);
    buffer_.clear();
    if (!written && pager_) {
        throw ReaderLeft();
    }
    if (!written) {
        throw store::Failure("cannot write the output: " + cause +
                                 "; make sure that its reader is running and its disk has room",
                             store::Cause::Other);
    }
}

std::unique_ptr<RowSink> MakeSink(const Style& style, Columns columns, Output& out) {
    out.page(style);
    switch (style.format) {
    case Format::Json:
        return std::make_unique<JsonSink>(std::move(columns), out);
    case Format::Ndjson:
        return std::make_unique<NdjsonSink>(std::move(columns), out);
    case Format::Csv:
        return std::make_unique<CsvSink>(style, std::move(columns), out);
    default:
        return MakeTable(style, std::move(columns), out);
    }
}

void WriteRecord(const Style& style, const std::vector<Value>& values, Output& out) {
    Columns columns;
    Cells cells;
    for (const Value& value : values) {
        columns.push_back({value.name, value.kind});
        cells.emplace_back(value.text);
    }
    if (style.format == Format::Table) {
        writeBelowEachOther(values, style.width, out);
        return;
    }
    const auto sink = MakeSink(style, std::move(columns), out);
    sink->row(cells);
    sink->finish();
}

}  // namespace quor::cli
