#include "dates.h"

#include <gtest/gtest.h>

#include <map>

#include "failure.h"

using namespace quor::cli;

namespace {

// 2026-03-30 00:30 local time, 2026-03-29 22:30 UTC
std::string date(const std::string& text) {
    return ParseDate(text, "--from", 1774823400);
}

TEST(Dates, AreLocalDaysThatExist) {
    setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);  // it changed its clocks on the night to 2026-03-29
    tzset();
    const std::map<std::string, const char*> cases{{"", ""},
                                                   {"2024-02-29", "2024-02-29"},
                                                   {"today", "2026-03-30"},
                                                   {"yesterday", "2026-03-29"},
                                                   {"0d", "2026-03-30"},
                                                   {"1d", "2026-03-29"},
                                                   {"30d", "2026-02-28"},
                                                   {"365d", "2025-03-30"}};
    for (const auto& [text, expected] : cases) {
        EXPECT_EQ(date(text), expected) << text;
    }
    for (const char* text : {"0", "2023-02-29", "1900-02-29", "2024-13-01", "2024-04-31", "2024-00-10", "2024-1-1",
                             "2024/01/01", "2024-01-01 ", "tomorrow", "d", "-1d", "+7d", "7", "7D", "99999999999d"}) {
        EXPECT_THROW(date(text), Failure) << text;
    }
}

}  // namespace
