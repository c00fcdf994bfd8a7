#include "store/dates.h"

#include <algorithm>
#include <string_view>

#include "base/numbers.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr std::string_view kDate = "dddd-dd-dd";
constexpr int kMaxDaysAgo = 36500;

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

bool isDigits(const std::string& text) {
    return !text.empty() && std::all_of(text.begin(), text.end(), isDigit);
}

bool hasShape(std::string_view text, std::string_view shape) {
    return std::equal(text.begin(), text.end(), shape.begin(), shape.end(),
                      [](char c, char wanted) { return wanted == 'd' ? isDigit(c) : c == wanted; });
}

int daysIn(int year, int month) {
    constexpr int kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const bool leap = (year % 4 == 0 && year % 100 != 0) || year % 400 == 0;
    return kDays[month - 1] + (month == 2 && leap ? 1 : 0);
}

bool isDate(const std::string& text) {
    if (!hasShape(text, kDate)) {
        return false;
    }
    const int year = ToInt32(text.c_str());
    const int month = ToInt32(&text[5]);
    const int day = ToInt32(&text[8]);
    return month >= 1 && month <= 12 && day >= 1 && day <= daysIn(year, month);
}

// Noon, so that a change of the clocks cannot move the date.
std::string daysAgo(int days, time_t now) {
    tm date = *localtime(&now);
    date.tm_mday -= days;
    date.tm_hour = 12;
    date.tm_isdst = -1;
    (void)mktime(&date);  // brings the day into its month
    char text[16];
    return {text, strftime(text, sizeof text, "%Y-%m-%d", &date)};
}

// -1 when it is no number of days.
int daysOf(const std::string& text) {
    if (text == "today") {
        return 0;
    }
    if (text == "yesterday") {
        return 1;
    }
    const bool counted = text.size() > 1 && text.size() < 8 && isDigits(text.substr(0, text.size() - 1));
    const int weeks = counted && text.back() == 'w' ? 7 : 1;
    return counted && (text.back() == 'd' || weeks == 7) ? ToInt32(text.c_str()) * weeks : -1;
}

// "hh:mm" or "hh:mm:ss" with the seconds; empty when it is neither.
std::string timeOfDay(const std::string& text) {
    const std::string time = hasShape(text, "dd:dd") ? text + ":00" : text;
    const bool right =
        hasShape(time, "dd:dd:dd") && ToInt32(time.c_str()) < 24 && ToInt32(&time[3]) < 60 && ToInt32(&time[6]) < 60;
    return right ? time : "";
}

tm brokenDown(const std::string& date, const std::string& time) {
    tm parts = {};
    parts.tm_year = ToInt32(date.c_str()) - 1900;
    parts.tm_mon = ToInt32(&date[5]) - 1;
    parts.tm_mday = ToInt32(&date[8]);
    parts.tm_hour = ToInt32(time.c_str());
    parts.tm_min = ToInt32(&time[3]);
    parts.tm_sec = ToInt32(&time[6]);
    parts.tm_isdst = -1;
    return parts;
}

// Seconds east of UTC in "Z", "+hh:mm" and "+hhmm"; false when it is none of them.
bool readZone(const std::string& text, int& seconds) {
    const bool colon = hasShape(text.substr(std::min<size_t>(1, text.size())), "dd:dd");
    if (text != "Z" &&
        (text.empty() || (text[0] != '+' && text[0] != '-') || (!colon && !hasShape(text.substr(1), "dddd")))) {
        return false;
    }
    const int hours = text == "Z" ? 0 : ToInt32(text.substr(1, 2).c_str());
    const int minutes = text == "Z" ? 0 : ToInt32(text.substr(colon ? 4 : 3).c_str());
    seconds = (hours * 60 + minutes) * (text[0] == '-' ? -60 : 60);
    return hours < 24 && minutes < 60;
}

// Date and time of day, the zone if wanted; false when the text is something else.
bool readDateAndTime(const std::string& text, Moment& moment) {
    if (text.size() < 16 || (text[10] != ' ' && text[10] != 'T') || !isDate(text.substr(0, 10))) {
        return false;
    }
    const size_t zone = std::min(text.find_first_of("Z+-", 11), text.size());
    const size_t time = std::min(text.find_first_of(".,", 11), zone);  // a fraction of a second is left out
    if (time != zone && !isDigits(text.substr(time + 1, zone - time - 1))) {
        return false;
    }
    moment = {text.substr(0, 10), timeOfDay(text.substr(11, time - 11))};
    if (moment.time.empty() || zone == text.size()) {
        return !moment.time.empty();
    }
    int offset = 0;
    if (!readZone(text.substr(zone), offset)) {
        return false;
    }
    tm utc = brokenDown(moment.date, moment.time);
    const time_t seconds = timegm(&utc);
    moment = MomentOf(int64_t{seconds} - offset);
    return seconds != -1;  // which nobody means
}

}  // namespace

Moment MomentOf(int64_t seconds) {
    const bool known = static_cast<time_t>(seconds) == seconds;  // it may have 32 bits
    const std::string text = known ? LocalTime(seconds) : "";
    const bool comparable = hasShape(text, "dddd-dd-ddTdd:dd:dd");  // years of four digits
    return comparable ? Moment{text.substr(0, 10), text.substr(11)} : Moment();
}

Moment ParseMoment(const std::string& text, const std::string& option, time_t now) {
    if (text.empty() || isDate(text)) {
        return {text, ""};
    }
    const int days = daysOf(text);
    if (days >= 0 && days <= kMaxDaysAgo) {
        return {daysAgo(days, now), ""};
    }
    if (text == "now") {
        return MomentOf(now);
    }
    if (!timeOfDay(text).empty()) {
        return {daysAgo(0, now), timeOfDay(text)};
    }
    Moment moment;
    if (readDateAndTime(text, moment) && !moment.empty()) {
        return moment;
    }
    moment = {};
    if (days < 0 && text.size() < 8 && text.find_first_of("smh") == text.size() - 1 &&
        isDigits(text.substr(0, text.size() - 1))) {
        moment = MomentOf(int64_t{now} - static_cast<int64_t>(ParseSpan(text, option)));
    }
    if (!moment.empty()) {
        return moment;
    }
    throw Failure(option + ": no such time '" + text +
                  "'; give 6h, today, yesterday, 7d, 10:00, YYYY-MM-DD or 'YYYY-MM-DD hh:mm'");
}

time_t BeginOf(const Moment& moment) {
    tm parts = brokenDown(moment.date, moment.time.empty() ? "00:00:00" : moment.time);
    return mktime(&parts);
}

time_t EndOf(const Moment& moment) {
    if (!moment.time.empty()) {
        return BeginOf(moment);
    }
    tm next = brokenDown(moment.date, "00:00:00");
    ++next.tm_mday;
    return mktime(&next) - 1;
}

uint64_t ParseSpan(const std::string& text, const std::string& option) {
    constexpr std::string_view kUnits = "smhdw";
    constexpr uint64_t kSeconds[] = {1, 60, 3600, 86400, 604800};
    const size_t unit = text.empty() ? std::string_view::npos : kUnits.find(text.back());
    if (unit == std::string_view::npos || text.size() > 7 || !isDigits(text.substr(0, text.size() - 1))) {
        throw Failure(option + ": no such time span '" + text + "'; give 90s, 10m, 6h, 2d or 1w");
    }
    return ToUint64(text.c_str()) * kSeconds[unit];
}

std::string LocalTime(int64_t seconds) {
    const auto clock = static_cast<time_t>(seconds);
    const tm* local = localtime(&clock);
    char text[64];
    return local == nullptr ? "" : std::string(text, strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", local));
}

}  // namespace quor::store
