// Dates as a person gives them, in the form in which logs are dated.
#ifndef STORE_DATES_H
#define STORE_DATES_H

#include <cstdint>
#include <ctime>
#include <string>

namespace quor::store {

// "YYYY-MM-DD" of a date given so, or as "today", "yesterday" or "7d" (that many days ago) in local time; the empty
// text stays empty. `option` is named in the Failure of anything else.
std::string ParseDate(const std::string& text, const std::string& option, time_t now);

// The first second of a day "YYYY-MM-DD" in local time, or of the day that many days later.
time_t DayBegin(const std::string& date, int daysLater = 0);

// Seconds of a time span such as "90s", "10m", "6h" or "2d"; `option` is named in the Failure of anything else.
uint64_t ParseSpan(const std::string& text, const std::string& option);

// "YYYY-MM-DDThh:mm:ss" in local time.
std::string LocalTime(int64_t seconds);

}  // namespace quor::store

#endif
