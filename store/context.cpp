#include "store/context.h"

#include <algorithm>
#include <vector>

namespace quor::store {
namespace {

// Goes through the hits in their order, which `leading_` and `trailing_` follow as well: with the newest row first, the
// rows after a hit lead to it.
class Surroundings {
  public:
    Surroundings(const Source& source, const Selection& selection, const Context& context,
                 const ContextHandler& handler)
        : source_(source), table_(selection.table), ascending_(selection.oldestFirst),
          leading_(ascending_ ? context.before : context.after), trailing_(ascending_ ? context.after : context.before),
          handler_(handler) {}

    void hit(const Record& record) {
        const uint64_t id = record.id;
        const std::vector<Record> rows = any_ ? between(id, trailing_ + leading_ + 1) : std::vector<Record>();
        const bool near = any_ && rows.size() <= trailing_ + leading_;
        tell(rows, near ? rows.size() : static_cast<size_t>(trailing_));
        if (!near) {
            lead(id);
        }
        handler_(record, true, apart_);
        reached_ = id;
        apart_ = false;
        any_ = true;
    }

    void finish() {
        if (any_ && trailing_ != 0) {
            tell(read({beyond(reached_)}, ascending_, trailing_), static_cast<size_t>(trailing_));
        }
    }

  private:
    // Rows on the way from an id, and rows on the way to it.
    _SYSLOG_SQL_COND_tag beyond(uint64_t id) const {
        return IdCondition(ascending_ ? SYSLOG_OP_ABOVE : SYSLOG_OP_BELOW, id);
    }
    _SYSLOG_SQL_COND_tag shortOf(uint64_t id) const {
        return IdCondition(ascending_ ? SYSLOG_OP_BELOW : SYSLOG_OP_ABOVE, id);
    }

    std::vector<Record> read(std::list<_SYSLOG_SQL_COND_tag> ids, bool ascending, uint64_t limit) const {
        std::vector<Record> rows;
        source_.read(table_, {std::move(ids), {}}, {limit, 0}, ascending,
                     [&](const Record& record) { rows.push_back(record); });
        return rows;
    }

    // The first rows between the last one handed over and `id`.
    std::vector<Record> between(uint64_t id, uint64_t limit) const {
        const bool adjacent = std::max(id, reached_) - std::min(id, reached_) <= 1;
        return adjacent ? std::vector<Record>() : read({beyond(reached_), shortOf(id)}, ascending_, limit);
    }

    void tell(const std::vector<Record>& rows, size_t most) {
        for (size_t i = 0; i < std::min(rows.size(), most); ++i) {
            handler_(rows[i], false, apart_);
            apart_ = false;
            reached_ = rows[i].id;
        }
    }

    // The rows that lead to a hit far from the one before. The one row more shows whether any is left out.
    void lead(uint64_t id) {
        std::list<_SYSLOG_SQL_COND_tag> ids = {shortOf(id)};
        if (any_) {
            ids.push_back(beyond(reached_));
        }
        std::vector<Record> rows = read(std::move(ids), !ascending_, leading_ + 1);
        apart_ = any_ && rows.size() > leading_;
        rows.resize(std::min(rows.size(), static_cast<size_t>(leading_)));
        std::reverse(rows.begin(), rows.end());
        tell(rows, rows.size());
    }

    const Source& source_;
    const std::string& table_;
    const bool ascending_;
    const uint64_t leading_;
    const uint64_t trailing_;
    const ContextHandler& handler_;
    uint64_t reached_ = 0;  // the id of the last row handed over
    bool any_ = false;
    bool apart_ = false;
};

}  // namespace

uint64_t SelectWithContext(const Source& source, const Selection& selection, const Context& context,
                           const ContextHandler& handler) {
    Surroundings surroundings(source, selection, context, handler);
    const uint64_t hits = Select(source, selection, [&](const Record& record) { surroundings.hit(record); });
    surroundings.finish();
    return hits;
}

}  // namespace quor::store
