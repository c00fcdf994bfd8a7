#include "filters.h"

#include <gtest/gtest.h>

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
    const struct {
        std::string FilterOptions::*member;
        const char* value;
        const char* sql;
        const char* literal;
    } cases[] = {
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
    for (const auto& test : cases) {
        SCOPED_TRACE(test.value);
        const Filter filter = BuildFilter(with(test.member, test.value), "logs", 0);
        EXPECT_EQ(sqlOf(filter.conditions), test.sql);
        EXPECT_EQ(filter.literal, test.literal);
    }
}

TEST(Filters, ThatWouldMatchSomethingElseAreRefused) {
    const struct {
        std::string FilterOptions::*member;
        const char* value;
        const char* table;
    } cases[] = {
        {&FilterOptions::host, "a,,b", "logs"},
        {&FilterOptions::host, ",", "logs"},
        {&FilterOptions::host, "a,any", "logs"},
        {&FilterOptions::level, "warn", "logs"},
        {&FilterOptions::level, "err,", "logs"},
        {&FilterOptions::level, "+", "logs"},
        {&FilterOptions::from, "soon", "logs"},
        {&FilterOptions::facility, "kern", "general_log"},
        {&FilterOptions::level, "err", "transfer_log"},
        {&FilterOptions::keyword, "x", "transfer_log"},
        {&FilterOptions::facility, "kern", "transfer_log"},
    };
    for (const auto& test : cases) {
        EXPECT_THROW(BuildFilter(with(test.member, test.value), test.table, 0), Failure) << test.value;
    }
    EXPECT_THROW(BuildFilter(with(&FilterOptions::glob, std::string(20000, '[')), "logs", 0), Failure);
    FilterOptions backwards = with(&FilterOptions::from, "2026-02-02");
    backwards.to = "2026-02-01";
    EXPECT_THROW(BuildFilter(backwards, "logs", 0), Failure);
}

}  // namespace
