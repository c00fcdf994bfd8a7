// Dates as a person gives them, in the form in which logs are dated.
#ifndef QUORLOG_DATES_H
#define QUORLOG_DATES_H

#include <ctime>
#include <string>

namespace quor::cli {

// "YYYY-MM-DD" of a date given so, or as "today", "yesterday" or "7d" (that many days ago) in local time; the empty
// text stays empty. `option` is named in the Failure of anything else.
std::string ParseDate(const std::string& text, const std::string& option, time_t now);

}  // namespace quor::cli

#endif
