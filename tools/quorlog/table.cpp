// The aligned table. Rows wait until the widths of the first ones are known; later rows keep these widths, so that a
// table of any length streams.
#include <algorithm>
#include <array>

#include "dbutil.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/layout.h"
#include "tools/quorlog/output.h"

namespace quor::cli {
namespace {

constexpr size_t kSample = 200;  // rows that decide the widths
constexpr char kGap[] = "--\n";

constexpr std::array<const char*, 8> kLevelColors = {
    "\033[1;31m", "\033[1;31m", "\033[1;31m",  // emerg, alert, crit
    "\033[31m",   "\033[33m",   "\033[36m",    // err, warning, notice
    "",           "\033[2m",                   // info, debug
};

const char* colorOf(std::string_view level) {
    const auto* found = std::find(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), level);
    const auto index = static_cast<size_t>(found - std::begin(g_MappingSyslogPrior));
    return index < kLevelColors.size() ? kLevelColors[index] : "";
}

class TableSink : public RowSink {
  public:
    TableSink(const Style& style, Columns columns, Output& out)
        : RowSink(std::move(columns), out), color_(style.color), layout_(columns_, style.width) {
        if (columns_.size() < 2) {
            return;
        }
        Line heading;
        for (const Column& column : columns_) {
            Cell cell;
            cell.width = AppendVisible(cell.text, column.name);
            std::transform(cell.text.begin(), cell.text.end(), cell.text.begin(), upper);
            heading.push_back(cell);
        }
        waiting_.push_back(heading);
    }

    void row(const Cells& cells) override {
        Line line(columns_.size());
        for (size_t i = 0; i < line.size(); ++i) {
            line[i].width = AppendVisible(line[i].text, cells[i]);
            if (color_ && columns_[i].kind == Kind::Level) {
                line[i].color = colorOf(cells[i]);
            }
        }
        add(std::move(line));
    }

    void gap() override { add({}); }

    void flush() override {
        if (anyRow()) {
            print();
        }
        out_.flush();
    }

  private:
    static char upper(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; }

    // A heading alone is not worth a line.
    bool anyRow() const { return printed_ ? !waiting_.empty() : waiting_.size() > (columns_.size() < 2 ? 0 : 1); }

    void add(Line line) {
        waiting_.push_back(std::move(line));
        if (waiting_.size() > pending_) {
            print();
        }
    }

    void print() {
        for (const Line& line : waiting_) {
            layout_.widen(line);
        }
        for (const Line& line : waiting_) {
            if (line.empty()) {
                out_.buffer() += kGap;
            } else {
                layout_.append(out_.buffer(), line);
            }
            out_.drain();
        }
        waiting_.clear();
        printed_ = true;
        pending_ = 0;
    }

    bool color_;
    bool printed_ = false;
    size_t pending_ = kSample;  // lines that may wait
    Layout layout_;
    std::vector<Line> waiting_;  // an empty one is a gap
};

}  // namespace

std::unique_ptr<RowSink> MakeTable(const Style& style, Columns columns, Output& out) {
    return std::make_unique<TableSink>(style, std::move(columns), out);
}

}  // namespace quor::cli
