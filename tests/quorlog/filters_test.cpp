#include "filters.h"

#include <gtest/gtest.h>

#include <map>

#include "dates.h"
#include "failure.h"

using namespace quor::cli;

namespace {

std::string sqlOf(Conditions conditions) {
    std::string sql;
    SqlCondListToStr(conditions, sql);
    return sql;
}

FilterOptions with(std::string FilterOptions::*member, const std::string& value) {
    FilterOptions options;
    options.*member = value;
    return options;
}

TEST(Filters, BecomeConditions) {
    const std::tuple<std::string FilterOptions::*, const char*, const char*, const char*> cases[] = {
        {&FilterOptions::host, "any", "", ""},
        {&FilterOptions::host, "a,O'Neil", "((host = 'a') OR (host = 'O''Neil'))", ""},
        {&FilterOptions::level, "crit+", "((llevel = 'emerg') OR (llevel = 'alert') OR (llevel = 'crit'))", ""},
        {&FilterOptions::level, "emerg+,debug", "((llevel = 'emerg') OR (llevel = 'debug'))", ""},
        {&FilterOptions::facility, "kern", "(fac = 'kern')", ""},
        {&FilterOptions::program, "sshd", "(prog = 'sshd')", ""},
        {&FilterOptions::keyword, "[x] 'y'", "(msg GLOB '*[[]x[]] ''y''*')", ""},
        {&FilterOptions::keyword, "why? *", "(msg GLOB '*why? ?*')", "why? *"},
        {&FilterOptions::glob, "a*b?", "(msg GLOB 'a*b?')", ""},
        {&FilterOptions::glob, "**", "", ""},
        {&FilterOptions::from, "2026-01-02", "(ldate >= '2026-01-02')", ""},
        {&FilterOptions::to, "2026-01-02", "(ldate <= '2026-01-02')", ""},
    };
    for (const auto& [member, value, sql, literal] : cases) {
        const Filter filter = BuildFilter(with(member, value), "logs", 0);
        EXPECT_EQ(sqlOf(filter.conditions), sql) << value;
        EXPECT_EQ(filter.literal, literal) << value;
    }
}

TEST(Filters, ThatWouldMatchSomethingElseAreRefused) {
    const std::tuple<std::string FilterOptions::*, const char*, const char*> cases[] = {
        {&FilterOptions::host, "a,,b", "logs"},
        {&FilterOptions::host, "a,any", "logs"},
        {&FilterOptions::level, "warn", "logs"},
        {&FilterOptions::level, "err,", "logs"},
        {&FilterOptions::level, "+", "logs"},
        {&FilterOptions::from, "soon", "logs"},
        {&FilterOptions::facility, "kern", "general_log"},
        {&FilterOptions::level, "err", "transfer_log"},
        {&FilterOptions::keyword, "x", "transfer_log"},
    };
    for (const auto& [member, value, table] : cases) {
        EXPECT_THROW(BuildFilter(with(member, value), table, 0), Failure) << value;
    }
    EXPECT_THROW(BuildFilter(with(&FilterOptions::glob, std::string(20000, '[')), "logs", 0), Failure);
    FilterOptions backwards = with(&FilterOptions::from, "2026-02-02");
    backwards.to = "2026-02-01";
    EXPECT_THROW(BuildFilter(backwards, "logs", 0), Failure);
}

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
