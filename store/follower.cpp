#include "store/follower.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "store/failure.h"

namespace quor::store {
namespace {

bool isBrought(const std::vector<IdRange>& ranges, uint64_t id) {
    return std::any_of(ranges.begin(), ranges.end(),
                       [id](const IdRange& range) { return range.first <= id && id <= range.last; });
}

// Behind the rows put there that begin right after `after`: there may be millions.
uint64_t behind(const std::vector<IdRange>& ranges, uint64_t after) {
    for (const IdRange& range : ranges) {
        after = range.first <= after + 1 ? std::max(after, range.last) : after;
    }
    return after;
}

}  // namespace

Follower::Follower(const Source& source, Selection selection)
    : source_(source), selection_(std::move(selection)), start_([](const std::string&) { return 0; }),
      identity_(source.identity()), after_(LargestId(source, selection_.table)) {}

Follower::Follower(const Source& source, Selection selection, Start start)
    : source_(source), selection_(std::move(selection)), start_(std::move(start)) {}

void Follower::last(uint64_t rows, const RecordHandler& handler) const {
    Selection before = selection_;
    before.filter.conditions.attributes.push_back(IdCondition(SYSLOG_OP_AT_MOST, after_));
    before.limit = rows;
    before.offset = 0;
    before.oldestFirst = rows == 0;  // all of them need no turning round
    if (before.oldestFirst) {
        Select(source_, before, handler);
        return;
    }
    std::vector<Record> newestFirst;
    Select(source_, before, [&](const Record& record) { newestFirst.push_back(record); });
    std::for_each(newestFirst.rbegin(), newestFirst.rend(), handler);
}

// False while there is nothing to follow.
bool Follower::enter(const std::string& identity) {
    if (identity.empty()) {
        return false;
    }
    if (identity != identity_) {
        after_ = start_(identity);
        identity_ = identity;
    }
    return true;
}

// Read after the newest id, so that a row that is looked at is known for what it is.
std::vector<IdRange> Follower::broughtInto(const std::string& table) const {
    return table == "logs" ? source_.brought(after_) : std::vector<IdRange>();
}

// Every row up to the newest is done with, whether the filter takes it or not. The file may have been replaced since
// its identity was read: rows that are at hand are of the same collection when that is still there.
uint64_t Follower::look(const RecordHandler& handler) {
    const uint64_t newest = LargestId(source_, selection_.table);
    if (newest <= after_) {
        after_ = newest;  // rows that were put back from a copy may end before: what follows them is new
        return 0;
    }
    const std::vector<IdRange> brought = broughtInto(selection_.table);
    Selection arrived = selection_;
    arrived.filter.conditions.attributes.push_back(IdCondition(SYSLOG_OP_AT_MOST, newest));
    uint64_t reached = behind(brought, after_);
    bool first = true;
    bool same = true;
    const uint64_t rows = SelectAfter(source_, arrived, reached, [&](const Record& record) {
        same = first ? source_.identity() == identity_ : same;
        first = false;
        if (same && !isBrought(brought, record.id)) {
            handler(record);
        }
    });
    same = first ? source_.identity() == identity_ : same;
    if (same) {
        after_ = rows < kPiece ? std::max(newest, reached) : reached;
    }
    return same ? rows : 0;
}

bool Follower::poll(const RecordHandler& handler) {
    try {
        return enter(source_.identity()) && look(handler) == kPiece;
    } catch (const Failure& failure) {
        const bool begins = after_ == 0 && failure.cause() == Cause::Missing;  // no table before its first row
        if (!begins && failure.cause() != Cause::Busy) {
            throw;
        }
        return false;
    }
}

}  // namespace quor::store
