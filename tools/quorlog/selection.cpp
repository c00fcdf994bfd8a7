#include "selection.h"

#include <algorithm>

#include "ask.h"
#include "failure.h"
#include "text.h"

namespace quor::cli {
namespace {

using Record = _SYSLOG_LOG_DATA_tag;

constexpr uint64_t kPiece = 8192;                 // rows held in memory at a time
constexpr uint64_t kMaxSpan = uint64_t{1} << 24;  // ids looked at in one go where few match

// One call of the library. Returns the number of rows it gave.
uint64_t call(const Selection& selection, Conditions conditions, _SYSLOG_SQL_LIMIT_tag limit, bool ascending,
              const RecordHandler& handler) {
    struct Walk {
        const RecordHandler& handler;
        uint64_t rows = 0;
    } walk{handler};
    const auto visit = [](Record& record, void* context) {
        auto& current = *static_cast<Walk*>(context);
        ++current.rows;
        current.handler(record);
        return 0;
    };
    std::string db = selection.db;
    std::string table = selection.table;
    _SYSLOG_SQL_ORDER_tag order{ascending ? 1 : 0, SYSLOG_ATTRI_ID};
    if (SyslogDBSelectByTable(db, table, conditions, &limit, &order, visit, &walk, false) < 0) {
        FailQuery(selection.db, selection.table, conditions);
    }
    return walk.rows;
}

// Without a filter the library pages by ids and counts the largest id: exact only while no row was deleted. A condition
// that every row meets makes both exact.
Conditions exact(const Selection& selection) {
    if (selection.filter.conditions.empty()) {
        return {IdCondition(kAtLeast, 0)};
    }
    return selection.filter.conditions;
}

Conditions between(const Selection& selection, uint64_t first, uint64_t last) {
    Conditions conditions = selection.filter.conditions;
    conditions.push_back(IdCondition(kAtLeast, first));
    conditions.push_back(IdCondition(kAtMost, last));
    return conditions;
}

// The first and the last id of the table; false when it is empty.
bool edges(const Selection& selection, uint64_t& first, uint64_t& last) {
    const Selection all{selection.db, selection.table, {}};
    return call(all, exact(all), {1, 0}, true, [&](const Record& record) { first = record.id; }) != 0 &&
           call(all, exact(all), {1, 0}, false, [&](const Record& record) { last = record.id; }) != 0;
}

// Counts off what offset and limit leave.
class Window {
  public:
    Window(const Selection& selection, const RecordHandler& handler) : selection_(selection), handler_(handler) {}

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

// Walks the ids in spans. A span bounds what one statement scans or sorts, the piece what it returns; spans grow while
// few rows match.
uint64_t selectInPieces(const Selection& selection, const RecordHandler& handler) {
    Window window(selection, handler);
    uint64_t first = 0;
    uint64_t last = 0;
    bool more = edges(selection, first, last);
    uint64_t span = kPiece;
    while (more && !window.full()) {
        const uint64_t width = std::min(span - 1, last - first);
        const uint64_t low = selection.oldestFirst ? first : last - width;
        const uint64_t high = low + width;
        uint64_t reached = 0;
        const uint64_t rows = call(selection, between(selection, low, high), {kPiece, 0}, selection.oldestFirst,
                                   [&](const Record& record) {
                                       reached = record.id;
                                       window.take(record);
                                   });
        const uint64_t end = selection.oldestFirst ? high : low;
        const uint64_t done = rows == kPiece ? reached : end;
        span = rows < kPiece / 4 ? std::min(span * 2, kMaxSpan) : kPiece;
        more = selection.oldestFirst ? done < last : done > first;
        (selection.oldestFirst ? first : last) = selection.oldestFirst ? done + 1 : done - 1;
    }
    return window.taken();
}

}  // namespace

uint64_t Select(const Selection& selection, const RecordHandler& handler) {
    const bool page = selection.limit != 0 && selection.limit <= kPiece && selection.offset <= UINT32_MAX &&
                      selection.filter.literal.empty();
    if (!page) {
        return selectInPieces(selection, handler);
    }
    return call(selection, exact(selection), {selection.limit, selection.offset}, selection.oldestFirst, handler);
}

uint64_t SelectAfter(const Selection& selection, uint64_t after, const RecordHandler& handler) {
    uint64_t taken = 0;
    for (uint64_t rows = kPiece; rows == kPiece;) {
        Conditions conditions = selection.filter.conditions;
        conditions.push_back(IdCondition(kAbove, after));
        rows = call(selection, conditions, {kPiece, 0}, true, [&](const Record& record) {
            after = record.id;
            if (selection.filter.accepts(record)) {
                ++taken;
                handler(record);
            }
        });
    }
    return taken;
}

uint64_t Count(const Selection& selection) {
    if (!selection.filter.literal.empty()) {
        Selection all = selection;
        all.limit = 0;
        all.offset = 0;
        return selectInPieces(all, [](const Record&) {});
    }
    std::string db = selection.db;
    std::string table = selection.table;
    Conditions conditions = exact(selection);
    const int count = SyslogDBSelectCountByTable(db, table, conditions, nullptr, nullptr);
    if (count < 0) {
        FailQuery(selection.db, selection.table, conditions);
    }
    return static_cast<uint64_t>(count);
}

uint64_t EstimateCount(const Selection& selection) {
    const Selection all{selection.db, selection.table, {}};
    uint64_t largest = 0;
    call(all, exact(all), {1, 0}, false, [&](const Record& record) { largest = record.id; });
    return largest;
}

bool AnyRow(const std::string& db, const std::string& table, const Conditions& conditions) {
    const Selection one{db, table, {conditions, ""}};
    return call(one, exact(one), {1, 0}, false, [](const Record&) {}) != 0;
}

void FailQuery(const std::string& db, const std::string& table, Conditions conditions) {
    std::string where;
    SqlCondListToStr(conditions, where);
    (void)Ask(db, "SELECT 1 FROM " + table + (where.empty() ? "" : " WHERE " + where) + " LIMIT 1", "1");
    throw QueryFailure(Visible(db) + ": the query failed; see the system log");
}

}  // namespace quor::cli
