#include "platform/archive/question.h"

#include <algorithm>
#include <cstring>

namespace quor::archive {
namespace {

bool holds(std::string_view text, const std::string& part) {
    return part.empty() || memmem(text.data(), text.size(), part.data(), part.size()) != nullptr;
}

// Whether a value may meet a term. NULL meets none; what is neither text nor NULL is left to SQLite.
bool meets(const Term& term, const Cell& cell) {
    if (!cell.isText()) {
        return cell.kind != Cell::Kind::Null;
    }
    switch (term.how) {
    case Compared::Equal:
    case Compared::Among:
        return std::find(term.values.begin(), term.values.end(), cell.bytes) != term.values.end();
    case Compared::Below:
    case Compared::AtMost:
        return cell.bytes <= term.values.front();
    case Compared::Above:
    case Compared::AtLeast:
        return cell.bytes >= term.values.front();
    default:
        return holds(cell.bytes, term.part);
    }
}

bool mayMeet(const Term& term, const Range& range) {
    if (!range.texts()) {
        return true;
    }
    const auto reaches = [&range](const std::string& value) {
        return range.kind == Range::Kind::TextsFrom || value <= range.mostText;
    };
    switch (term.how) {
    case Compared::Equal:
    case Compared::Among:
        return std::any_of(term.values.begin(), term.values.end(),
                           [&](const std::string& value) { return range.leastText <= value && reaches(value); });
    case Compared::Below:
    case Compared::AtMost:
        return range.leastText <= term.values.front();
    case Compared::Above:
    case Compared::AtLeast:
        return reaches(term.values.front());
    default:
        return true;
    }
}

bool mayMeet(const Term& term, const ColumnHead& head) {
    if (head.encoding == Encoding::Constant) {
        return meets(term, head.constant);
    }
    if (head.dictionary) {
        return std::any_of(head.values.begin(), head.values.end(),
                           [&term](const Entry& entry) { return meets(term, entry.cell); });
    }
    return mayMeet(term, head.range);
}

// The rows of a column of texts that hold a part: found in all texts at once.
std::vector<uint32_t> rowsWith(const std::string& part, const Column& column) {
    std::vector<uint32_t> rows;
    const std::vector<uint32_t>& starts = column.starts();
    const std::string& raw = column.raw();
    for (size_t from = 0; from < raw.size();) {
        const void* hit = memmem(raw.data() + from, raw.size() - from, part.data(), part.size());
        if (hit == nullptr) {
            break;
        }
        const auto at = static_cast<uint32_t>(static_cast<const char*>(hit) - raw.data());
        const auto next = std::upper_bound(starts.begin(), starts.end(), at);
        rows.push_back(static_cast<uint32_t>(next - starts.begin() - 1));
        from = *next;
    }
    return rows;
}

void keepIf(std::vector<uint32_t>& rows, const std::function<bool(size_t row)>& wanted) {
    rows.erase(std::remove_if(rows.begin(), rows.end(), [&wanted](uint32_t row) { return !wanted(row); }), rows.end());
}

void narrow(std::vector<uint32_t>& rows, const Term& term, const Column& column) {
    if (column.coded()) {
        std::vector<bool> wanted;
        for (const Entry& entry : column.entries()) {
            wanted.push_back(meets(term, entry.cell));
        }
        keepIf(rows, [&](size_t row) { return wanted[column.code(row)]; });
    } else if (column.texts() && !term.part.empty()) {
        const std::vector<uint32_t> found = rowsWith(term.part, column);
        std::vector<uint32_t> both;
        std::set_intersection(rows.begin(), rows.end(), found.begin(), found.end(), std::back_inserter(both));
        rows = std::move(both);
    } else {
        keepIf(rows, [&](size_t row) { return meets(term, column.at(row)); });
    }
}

// The first row with a number of at least `id`.
size_t rowFrom(Block& block, int64_t id) {
    size_t below = 0;
    for (size_t above = block.rows(); below < above;) {
        const size_t middle = below + (above - below) / 2;
        if (block.id(middle) < id) {
            below = middle + 1;
        } else {
            above = middle;
        }
    }
    return below;
}

std::vector<uint32_t> rowsBetween(Block& block, int64_t least, int64_t most) {
    const size_t begin = block.head().first >= least ? 0 : rowFrom(block, least);
    size_t end = block.rows();
    if (block.head().last > most) {
        end = rowFrom(block, most);
        end += end < block.rows() && block.id(end) == most ? 1 : 0;
    }
    std::vector<uint32_t> rows;
    rows.reserve(end - begin);
    for (size_t row = begin; row < end; ++row) {
        rows.push_back(static_cast<uint32_t>(row));
    }
    return rows;
}

}  // namespace

bool Question::mayConcern(const Block& block) const {
    return block.head().first <= most && block.head().last >= least &&
           std::all_of(terms.begin(), terms.end(),
                       [&block](const Term& term) { return mayMeet(term, block.columnHead(term.column)); });
}

bool Question::mayConcernWords(const Block& block) const {
    const auto concerned = [&block](const Term& term) {
        return !term.trigrams.empty() && block.head().bloomColumn == term.column;
    };
    if (std::none_of(terms.begin(), terms.end(), concerned)) {
        return true;
    }
    const std::string bloom = block.bloom();
    return std::all_of(terms.begin(), terms.end(),
                       [&](const Term& term) { return !concerned(term) || MayHold(bloom, term.trigrams); });
}

// Terms that only the expanded rows of a large column answer come last: often nothing is left to look at by then.
std::vector<uint32_t> Question::rowsOf(Block& block) const {
    std::vector<uint32_t> rows = rowsBetween(block, least, most);
    for (const bool coded : {true, false}) {
        for (const Term& term : terms) {
            const Encoding encoding = block.columnHead(term.column).encoding;
            const bool useful = term.how != Compared::Like && (term.how != Compared::Glob || !term.part.empty());
            if (useful && !rows.empty() && (encoding == Encoding::Dictionary) == coded &&
                encoding != Encoding::Constant) {
                narrow(rows, term, block.column(term.column));
            }
        }
    }
    return rows;
}

}  // namespace quor::archive
