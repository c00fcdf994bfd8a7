// What there is to tell of devices and of the rate of logs, where the library has no question for it.
#ifndef STORE_STATISTICS_H
#define STORE_STATISTICS_H

#include <cstdint>
#include <string>
#include <vector>

namespace quor::store {

// Unix seconds, both included.
struct TimeSpan {
    int64_t first;
    int64_t last;
};

struct DeviceCount {
    std::string device;
    uint64_t logs = 0;
};

// Of an accounting database: the devices with the most logs in the samples of that time; limit 0: all.
std::vector<DeviceCount> BusiestDevices(const std::string& db, const TimeSpan& span, uint64_t limit);

// The stamp of its oldest sample; 0 when there is none.
int64_t OldestSample(const std::string& db);

// The logs of the samples closed in a stretch of time.
struct Stretch {
    int64_t begin = 0;
    int64_t seconds = 0;  // of it that are within the time asked for; 0: not known
    uint64_t logs = 0;
};

// Of an accounting database: stretches of `step` seconds from the first sample of that time to the last, those without
// a sample, too. They begin where local clocks do: on the hour, at midnight. Failure when there would be too many.
std::vector<Stretch> Stretches(const std::string& db, const TimeSpan& span, int64_t step);

struct DeviceSeen {
    std::string device;
    uint64_t rows = 0;
    std::string first;  // date and time of the reception of its oldest row
    std::string last;
};

// Of a log database: every sender, the one that was heard last in front.
std::vector<DeviceSeen> DevicesSeen(const std::string& db);

}  // namespace quor::store

#endif
