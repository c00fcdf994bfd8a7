#include "platform/notify/interval.h"

#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

namespace quor::notify {
namespace {

// The ledger never grows beyond this: past it the entry that was sent longest ago gives way.
constexpr size_t kMostRecords = 512;

}  // namespace

Interval::Interval(int ledger, const Notice& notice) : ledger_(ledger) {
    static_assert(sizeof(Record) == 256);
    const std::string key = notice.tag + "\n" + notice.host;
    memcpy(record_.key, key.data(), std::min(key.size(), sizeof record_.key));

    std::vector<Record> records(kMostRecords);
    const ssize_t size = pread(ledger, records.data(), kMostRecords * sizeof(Record), 0);
    records.resize(size > 0 ? static_cast<size_t>(size) / sizeof(Record) : 0);
    const auto same = [&](const Record& record) { return memcmp(record.key, record_.key, sizeof record.key) == 0; };
    auto found = std::find_if(records.begin(), records.end(), same);
    if (found != records.end()) {
        record_ = *found;
    } else if (records.size() == kMostRecords) {
        found = std::min_element(records.begin(), records.end(),
                                 [](const Record& left, const Record& right) { return left.sent < right.sent; });
    }
    position_ = static_cast<size_t>(found - records.begin());
}

bool Interval::due(int32_t seconds, int64_t now) const {
    return now < record_.sent || now - record_.sent >= seconds;
}

bool Interval::countHeldBack() {
    record_.heldBack += record_.heldBack < UINT32_MAX ? 1 : 0;
    return store();
}

bool Interval::countSent(int32_t seconds, int64_t now) {
    const bool remembered = seconds > 0 || record_.heldBack > 0;
    record_.sent = now;
    record_.heldBack = 0;
    return !remembered || store();
}

bool Interval::store() const {
    const auto offset = static_cast<off_t>(position_ * sizeof(Record));
    return pwrite(ledger_, &record_, sizeof record_, offset) == static_cast<ssize_t>(sizeof record_);
}

}  // namespace quor::notify
