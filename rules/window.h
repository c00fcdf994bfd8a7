// "So many in a span of time", for each device.
#ifndef RULES_WINDOW_H
#define RULES_WINDOW_H

#include <cstddef>
#include <cstdint>
#include <deque>
#include <list>
#include <string>
#include <string_view>
#include <unordered_map>

namespace quor::rules {

// Whatever devices are invented, no more than `mostSeconds` seconds with logs in them are kept in all: the device whose
// last log is the oldest gives way.
class Windows {
  public:
    // `count` logs whose seconds differ by less than `span`.
    Windows(int64_t count, int64_t span, size_t mostSeconds) : count_(count), span_(span), mostSeconds_(mostSeconds) {}

    // One more log of the device of that name in that second. True when it completes the count, which begins anew then.
    // Logs that come a little late are put in their place; when the clock was set back, the count begins anew.
    bool add(const std::string& name, int64_t second);
    size_t seconds() const { return seconds_; }

  private:
    struct Second {
        int64_t second;
        int64_t logs;
    };
    struct Device {
        std::string name;
        std::deque<Second> seconds;  // ascending
        int64_t logs = 0;
    };
    using Place = std::list<Device>::iterator;

    Device& touch(const std::string& device);
    void put(Device& device, int64_t second);
    void dropOld(Device& device);
    void clear(Device& device);
    void makeRoom();

    int64_t count_;
    int64_t span_;
    size_t mostSeconds_;
    size_t seconds_ = 0;        // kept, of all devices
    std::list<Device> recent_;  // heard last first
    std::unordered_map<std::string_view, Place> known_;
};

}  // namespace quor::rules

#endif
