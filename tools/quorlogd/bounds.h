// Bounds on what senders of logs can make the process do.
#ifndef QUORLOGD_BOUNDS_H
#define QUORLOGD_BOUNDS_H

#include <algorithm>
#include <chrono>
#include <string>
#include <unordered_set>

namespace quor {

// At most `perMinute` notices at once, and as many a minute in the long run.
class NoticeBudget {
  public:
    using Time = std::chrono::steady_clock::time_point;

    NoticeBudget(unsigned perMinute, Time now) : perMinute_(perMinute), left_(perMinute), last_(now) {}

    // False when the notice is not to be sent.
    bool take(Time now) {
        const double minutes = std::chrono::duration<double, std::ratio<60>>(now - last_).count();
        left_ = std::min(left_ + minutes * perMinute_, static_cast<double>(perMinute_));
        last_ = now;
        const bool granted = left_ >= 1;
        left_ -= granted ? 1 : 0;
        return granted;
    }

  private:
    unsigned perMinute_;
    double left_;
    Time last_;
};

// Names of devices are whatever senders claim: only so many are counted apart, the others together.
class DeviceNames {
  public:
    explicit DeviceNames(size_t limit) : limit_(limit) {}

    // The name under which `device` is counted.
    const std::string& admit(const std::string& device) {
        if (known_.count(device) != 0) {
            return device;
        }
        if (known_.size() >= limit_ || device.size() > kMaxBytes) {
            return kOthers;
        }
        known_.insert(device);
        return device;
    }
    size_t count() const { return known_.size(); }

  private:
    static constexpr size_t kMaxBytes = 255;
    inline static const std::string kOthers = "(other devices)";

    size_t limit_;
    std::unordered_set<std::string> known_;
};

}  // namespace quor

#endif
