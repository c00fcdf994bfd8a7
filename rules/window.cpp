#include "rules/window.h"

#include <algorithm>

namespace quor::rules {
namespace {

constexpr int64_t kLate = 60;  // what is older than that was not late: the clock was set back

}  // namespace

Windows::Device& Windows::touch(const std::string& device) {
    const auto known = known_.find(device);
    if (known != known_.end()) {
        recent_.splice(recent_.begin(), recent_, known->second);
        return recent_.front();
    }
    recent_.push_front({device, {}, 0});
    known_.emplace(recent_.front().name, recent_.begin());
    return recent_.front();
}

void Windows::clear(Device& device) {
    seconds_ -= device.seconds.size();
    device.seconds.clear();
    device.logs = 0;
}

void Windows::put(Device& device, int64_t second) {
    std::deque<Second>& seconds = device.seconds;
    const auto place = std::lower_bound(seconds.begin(), seconds.end(), second,
                                        [](const Second& one, int64_t wanted) { return one.second < wanted; });
    ++device.logs;
    if (place != seconds.end() && place->second == second) {
        ++place->logs;
    } else {
        seconds.insert(place, {second, 1});
        ++seconds_;
    }
}

void Windows::dropOld(Device& device) {
    const int64_t first = device.seconds.back().second - span_ + 1;
    while (device.seconds.front().second < first) {
        device.logs -= device.seconds.front().logs;
        device.seconds.pop_front();
        --seconds_;
    }
}

void Windows::makeRoom() {
    while (seconds_ > mostSeconds_ && recent_.size() > 1) {
        clear(recent_.back());
        known_.erase(recent_.back().name);
        recent_.pop_back();
    }
}

bool Windows::add(const std::string& name, int64_t second) {
    Device& device = touch(name);
    if (!device.seconds.empty() && device.seconds.back().second - second >= std::max(span_, kLate)) {
        clear(device);
    }
    put(device, second);
    dropOld(device);
    const bool complete = device.logs >= count_;
    if (complete) {
        clear(device);
        known_.erase(device.name);
        recent_.pop_front();
    }
    makeRoom();
    return complete;
}

}  // namespace quor::rules
