#include "tools/quorlogd/devices.h"

namespace quor {
namespace {

constexpr size_t kMaxBytes = 255;
constexpr unsigned kNamesOfAddress = 256;
constexpr size_t kMostAddresses = 65536;
const std::string kOthers = "(other devices)";

}  // namespace

void Devices::insert(const std::string& name, int64_t day) {
    recent_.push_front({name, day});
    known_.emplace(recent_.front().name, recent_.begin());
}

void Devices::know(const std::string& name) {
    if (known_.count(name) == 0 && known_.size() < limit_) {
        insert(name, 0);
    }
}

bool Devices::makeRoom(int64_t day) {
    if (known_.size() < limit_) {
        return true;
    }
    if (recent_.empty() || recent_.back().day + 1 >= day) {
        return false;
    }
    known_.erase(recent_.back().name);
    recent_.pop_back();
    return true;
}

bool Devices::charge(const std::string& address, int64_t day) {
    if (day != day_) {
        brought_.clear();
        day_ = day;
    }
    if (brought_.size() >= kMostAddresses && brought_.count(address) == 0) {
        return false;
    }
    return brought_[address]++ < kNamesOfAddress;
}

const std::string& Devices::admit(const std::string& name, const std::string& address, int64_t day) {
    const auto known = known_.find(name);
    if (known != known_.end()) {
        known->second->day = day;
        recent_.splice(recent_.begin(), recent_, known->second);
        return known->second->name;
    }
    if (name.size() > kMaxBytes || !charge(address, day) || !makeRoom(day)) {
        return kOthers;
    }
    insert(name, day);
    return recent_.front().name;
}

}  // namespace quor
