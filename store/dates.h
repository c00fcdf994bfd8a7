// Dates and times as a person gives them, in the form in which logs are dated.
#ifndef STORE_DATES_H
#define STORE_DATES_H

#include <cstdint>
#include <ctime>
#include <string>

namespace quor::store {

// A second, or a whole day, of local time.
struct Moment {
    std::string date;  // YYYY-MM-DD; empty: none
    std::string time;  // hh:mm:ss; empty: the whole day

    bool empty() const { return date.empty(); }
    // Both, with a time that stands for the whole day's.
    std::string text(const char* timeOfDay) const { return date + " " + (time.empty() ? timeOfDay : time); }
};

// Days: "YYYY-MM-DD", "today", "yesterday", "7d", "2w" (that long ago). Seconds: "now", "90s", "10m", "6h" (that long
// ago), "10:00" (of today), "YYYY-MM-DD 10:00:30", and the same with a "T" and, if wanted, a zone as in ISO 8601. The
// empty text is no moment. `option` is named in the Failure of anything else.
Moment ParseMoment(const std::string& text, const std::string& option, time_t now);
// Empty when the machine has no time for these Unix seconds, or its year has not four digits.
Moment MomentOf(int64_t seconds);

// The first and the last second of a moment.
time_t BeginOf(const Moment& moment);
time_t EndOf(const Moment& moment);

// Seconds of a time span such as "90s", "10m", "6h", "2d" or "1w"; `option` is named in the Failure of anything else.
uint64_t ParseSpan(const std::string& text, const std::string& option);

// "YYYY-MM-DDThh:mm:ss" in local time.
std::string LocalTime(int64_t seconds);

}  // namespace quor::store

#endif
