// Which matches of the rules become notices and events. No sender can silence another one, and what is held back is
// counted.
#ifndef QUORLOGD_ALARMS_H
#define QUORLOGD_ALARMS_H

#include <chrono>
#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

namespace quor {

class Alarms {
  public:
    using Time = std::chrono::steady_clock::time_point;

    // `perMinute` notices in the long run, and as many at once; a sixth of it for each device, and half of it kept for
    // devices that were not heard lately.
    Alarms(unsigned perMinute, Time now) : perMinute_(perMinute), all_{static_cast<double>(perMinute), now} {}

    // The least seconds between two notices of one kind about one device.
    void setInterval(const std::string& kind, int32_t seconds) { intervals_[kind] = seconds; }

    // Whether a match of `device` becomes a notice. The interval is asked first, so that what it holds back costs
    // nothing of what the device, and then everybody, may send.
    bool grant(const std::string& kind, const std::string& device, Time now);

    // Matches held back since the last call, by device, the largest numbers first.
    std::vector<std::pair<std::string, uint64_t>> takeHeldBack();

    uint64_t granted() const { return granted_; }
    uint64_t heldBack() const { return heldBack_; }

  private:
    // So many at once, and as many a minute in the long run.
    struct Bucket {
        double left = 0;
        Time last;

        void refill(double perMinute, Time now);
    };
    struct Device {
        Bucket bucket;
        std::unordered_map<std::string, Time> sent;  // by kind
        uint64_t heldBack = 0;
    };

    bool isDue(const Device& device, const std::string& kind, Time now) const;
    bool afford(Device& device, bool heard, Time now);
    void forget(Time now);

    double perMinute_;
    Bucket all_;
    std::unordered_map<std::string, int32_t> intervals_;
    std::unordered_map<std::string, Device> devices_;
    uint64_t granted_ = 0;
    uint64_t heldBack_ = 0;
};

}  // namespace quor

#endif
