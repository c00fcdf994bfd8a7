#include "tools/quorlogd/alarms.h"

#include <algorithm>
#include <utility>

namespace quor {
namespace {

constexpr size_t kMostDevices = 4096;
constexpr std::chrono::hours kRemembered{1};

}  // namespace

void Alarms::Bucket::refill(double perMinute, Time now) {
    const double minutes = std::chrono::duration<double, std::ratio<60>>(now - last).count();
    left = std::min(left + minutes * perMinute, perMinute);
    last = now;
}

bool Alarms::isDue(const Device& device, const std::string& kind, Time now) const {
    const auto interval = intervals_.find(kind);
    const auto sent = device.sent.find(kind);
    return interval == intervals_.end() || sent == device.sent.end() ||
           now - sent->second >= std::chrono::seconds(interval->second);
}

bool Alarms::afford(Device& device, bool heard, Time now) {
    const double share = std::max(1.0, perMinute_ / 6);
    device.bucket.refill(share, now);
    all_.refill(perMinute_, now);
    const double kept = heard ? perMinute_ / 2 : 0;
    if (device.bucket.left < 1 || all_.left < 1 + kept) {
        return false;
    }
    device.bucket.left -= 1;
    all_.left -= 1;
    return true;
}

// Those that were not heard lately count as new again.
void Alarms::forget(Time now) {
    for (auto entry = devices_.begin(); entry != devices_.end();) {
        const bool old = now - entry->second.bucket.last > kRemembered && entry->second.heldBack == 0;
        entry = old ? devices_.erase(entry) : std::next(entry);
    }
}

bool Alarms::grant(const std::string& kind, const std::string& device, Time now) {
    auto known = devices_.find(device);
    const bool heard = known != devices_.end();
    if (!heard) {
        if (devices_.size() >= kMostDevices) {
            forget(now);
        }
        if (devices_.size() >= kMostDevices) {
            ++heldBack_;
            return false;
        }
        known = devices_.emplace(device, Device{{perMinute_, now}, {}, 0}).first;
    }
    Device& state = known->second;
    if (!isDue(state, kind, now) || !afford(state, heard, now)) {
        ++state.heldBack;
        ++heldBack_;
        return false;
    }
    state.sent[kind] = now;
    ++granted_;
    return true;
}

std::vector<std::pair<std::string, uint64_t>> Alarms::takeHeldBack() {
    std::vector<std::pair<std::string, uint64_t>> counts;
    for (auto& [name, device] : devices_) {
        if (device.heldBack != 0) {
            counts.emplace_back(name, std::exchange(device.heldBack, 0));
        }
    }
    std::sort(counts.begin(), counts.end(), [](const auto& a, const auto& b) { return a.second > b.second; });
    return counts;
}

}  // namespace quor
