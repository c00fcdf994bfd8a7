#include "store/selection.h"

#include <algorithm>

namespace quor::store {
namespace {

constexpr uint64_t kFirstPiece = 256;             // small, so that the first rows are there at once
constexpr uint64_t kMaxSpan = uint64_t{1} << 24;  // ids looked at in one go where few match

// The ids from `first` to `last`.
struct Span {
    uint64_t first;
    uint64_t last;
};

Conditions within(const Conditions& conditions, const Span& span) {
    Conditions both = conditions;
    both.attributes.push_back(IdCondition(SYSLOG_OP_AT_LEAST, span.first));
    both.attributes.push_back(IdCondition(SYSLOG_OP_AT_MOST, span.last));
    return both;
}

// The first and the last id of the table; false when it is empty.
bool edges(const Source& source, const std::string& table, Span& span) {
    return source.read(table, {}, {1, 0}, true, [&](const Record& record) { span.first = record.id; }) != 0 &&
           source.read(table, {}, {1, 0}, false, [&](const Record& record) { span.last = record.id; }) != 0;
}

// Counts off what offset and limit leave.
class Tally {
  public:
    Tally(const Selection& selection, const RecordHandler& handler) : selection_(selection), handler_(handler) {}

    void take(const Record& record) {
        if (full() || !selection_.filter.accepts(record) || seen_++ < selection_.offset) {
            return;
        }
        ++taken_;
        handler_(record);
    }
    bool full() const { return selection_.limit != 0 && taken_ == selection_.limit; }
    uint64_t taken() const { return taken_; }

  private:
    const Selection& selection_;
    const RecordHandler& handler_;
    uint64_t seen_ = 0;
    uint64_t taken_ = 0;
};

// The ids that are still to be looked at; the walk goes from one end to the other.
class Remainder {
  public:
    Remainder(const Span& all, bool fromBelow) : left_(all), fromBelow_(fromBelow) {}

    // The next ids, at most `width` of them.
    Span next(uint64_t width) const {
        const uint64_t reach = std::min(width - 1, left_.last - left_.first);
        return fromBelow_ ? Span{left_.first, left_.first + reach} : Span{left_.last - reach, left_.last};
    }
    // Drops everything up to and including `id`; false when nothing is left.
    bool drop(uint64_t id) {
        if (id == (fromBelow_ ? left_.last : left_.first)) {
            return false;
        }
        (fromBelow_ ? left_.first : left_.last) = fromBelow_ ? id + 1 : id - 1;
        return true;
    }

  private:
    Span left_;
    bool fromBelow_;
};

// Walks the ids in spans. A span bounds what one statement scans or sorts, the piece what it returns. Pieces grow up to
// kPiece, spans while few rows match.
uint64_t selectInPieces(const Source& source, const Selection& selection, const RecordHandler& handler) {
    Tally tally(selection, handler);
    Span all{};
    bool more = edges(source, selection.table, all);
    Remainder remainder(all, selection.oldestFirst);
    uint64_t piece = kFirstPiece;
    uint64_t width = piece;
    while (more && !tally.full()) {
        const Span span = remainder.next(width);
        uint64_t reached = 0;
        const auto take = [&](const Record& record) {
            reached = record.id;
            tally.take(record);
        };
        const uint64_t rows = source.read(selection.table, within(selection.filter.conditions, span), {piece, 0},
                                          selection.oldestFirst, take);
        const uint64_t end = selection.oldestFirst ? span.last : span.first;
        more = remainder.drop(rows == piece ? reached : end);
        const bool few = rows < piece / 4;
        piece = std::min(piece * 2, kPiece);
        width = few ? std::min(width * 2, kMaxSpan) : piece;
    }
    return tally.taken();
}

}  // namespace

uint64_t Select(const Source& source, const Selection& selection, const RecordHandler& handler) {
    const bool page = selection.limit != 0 && selection.limit <= kPiece && selection.offset <= UINT32_MAX &&
                      selection.filter.literal.empty();
    if (!page) {
        return selectInPieces(source, selection, handler);
    }
    return source.read(selection.table, selection.filter.conditions, {selection.limit, selection.offset},
                       selection.oldestFirst, handler);
}

uint64_t SelectAfter(const Source& source, const Selection& selection, uint64_t& after, const RecordHandler& handler) {
    Conditions conditions = selection.filter.conditions;
    conditions.attributes.push_back(IdCondition(SYSLOG_OP_ABOVE, after));
    return source.read(selection.table, conditions, {kPiece, 0}, true, [&](const Record& record) {
        after = record.id;
        if (selection.filter.accepts(record)) {
            handler(record);
        }
    });
}

uint64_t Count(const Source& source, const Selection& selection) {
    if (selection.filter.literal.empty()) {
        return source.count(selection.table, selection.filter.conditions);
    }
    Selection all = selection;
    all.limit = 0;
    all.offset = 0;
    return selectInPieces(source, all, [](const Record&) {});
}

uint64_t LargestId(const Source& source, const std::string& table) {
    uint64_t largest = 0;
    source.read(table, {}, {1, 0}, false, [&](const Record& record) { largest = record.id; });
    return largest;
}

bool AnyRow(const Source& source, const std::string& table, const Conditions& conditions) {
    return source.read(table, conditions, {1, 0}, false, [](const Record&) {}) != 0;
}

}  // namespace quor::store
