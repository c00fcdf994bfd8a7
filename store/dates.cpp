#include "store/dates.h"

#include <algorithm>
#include <string_view>

#include "base/numbers.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr char kShape[] = "dddd-dd-dd";
constexpr int kMaxDaysAgo = 36500;

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

bool isDigits(const std::string& text) {
    return !text.empty() && std::all_of(text.begin(), text.end(), isDigit);
}

bool hasShape(const std::string& text) {
    return std::equal(text.begin(), text.end(), std::begin(kShape), std::end(kShape) - 1,
                      [](char c, char shape) { return shape == 'd' ? isDigit(c) : c == shape; });
}

int daysIn(int year, int month) {
    constexpr int kDays[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const bool leap = (year % 4 == 0 && year % 100 != 0) || year % 400 == 0;
    return kDays[month - 1] + (month == 2 && leap ? 1 : 0);
}

bool isDate(const std::string& text) {
    if (!hasShape(text)) {
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

int daysOf(const std::string& text) {
    if (text == "today") {
        return 0;
    }
    if (text == "yesterday") {
        return 1;
    }
    const bool counted = !text.empty() && text.back() == 'd' && isDigits(text.substr(0, text.size() - 1));
    return counted ? ToInt32(text.c_str()) : -1;
}

}  // namespace

std::string ParseDate(const std::string& text, const std::string& option, time_t now) {
    if (text.empty() || isDate(text)) {
        return text;
    }
    const int days = daysOf(text);
    if (days < 0 || days > kMaxDaysAgo) {
        throw Failure(option + ": no such date '" + text + "'; give YYYY-MM-DD, today, yesterday or 7d");
    }
    return daysAgo(days, now);
}

time_t DayBegin(const std::string& date, int daysLater) {
    tm day = {};
    day.tm_year = ToInt32(date.c_str()) - 1900;
    day.tm_mon = ToInt32(&date[5]) - 1;
    day.tm_mday = ToInt32(&date[8]) + daysLater;
    day.tm_isdst = -1;
    return mktime(&day);
}

uint64_t ParseSpan(const std::string& text, const std::string& option) {
    constexpr std::string_view kUnits = "smhd";
    constexpr uint64_t kSeconds[] = {1, 60, 3600, 86400};
    const size_t unit = text.empty() ? std::string_view::npos : kUnits.find(text.back());
    if (unit == std::string_view::npos || text.size() > 7 || !isDigits(text.substr(0, text.size() - 1))) {
        throw Failure(option + ": no such time span '" + text + "'; give 90s, 10m, 6h or 2d");
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
