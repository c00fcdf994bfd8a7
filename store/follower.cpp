#include "store/follower.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "store/failure.h"

namespace quor::store {

Follower::Follower(const Source& source, Selection selection)
    : source_(source), selection_(std::move(selection)), identity_(source.identity()),
      after_(LargestId(source, selection_.table)) {}

void Follower::last(uint64_t rows, const RecordHandler& handler) const {
    Selection before = selection_;
    before.filter.conditions.push_back(IdCondition(SYSLOG_OP_AT_MOST, after_));
    before.limit = rows;
    before.offset = 0;
    before.oldestFirst = rows == 0;  // all of them need no turning round
    if (before.oldestFirst) {
        Select(source_, before, handler);
        return;
    }
    std::vector<_SYSLOG_LOG_DATA_tag> newestFirst;
    Select(source_, before, [&](const _SYSLOG_LOG_DATA_tag& record) { newestFirst.push_back(record); });
    std::for_each(newestFirst.rbegin(), newestFirst.rend(), handler);
}

void Follower::poll(const RecordHandler& handler) {
    const uint64_t identity = source_.identity();
    const bool replaced = identity != identity_;
    uint64_t newest = 0;
    try {
        newest = LargestId(source_, selection_.table);
    } catch (const Failure& failure) {
        if (replaced && failure.cause() == Cause::Missing) {
            return;  // the new one is about to be made
        }
        throw;
    }
    if (replaced) {
        identity_ = identity;
        after_ = 0;
    }
    deliver(newest, handler);
}

// Every row up to the newest is done with, whether the filter takes it or not: the next look begins behind it.
void Follower::deliver(uint64_t newest, const RecordHandler& handler) {
    if (newest <= after_) {
        return;
    }
    Selection arrived = selection_;
    arrived.filter.conditions.push_back(IdCondition(SYSLOG_OP_AT_MOST, newest));
    SelectAfter(source_, arrived, after_, [&](const _SYSLOG_LOG_DATA_tag& record) {
        after_ = record.id;
        handler(record);
    });
    after_ = newest;
}

}  // namespace quor::store
