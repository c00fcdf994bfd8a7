// Texts as they are shown, and dates as they are read.
#include <gtest/gtest.h>

#include <algorithm>
#include <map>
#include <sstream>

#include "store/dates.h"
#include "store/failure.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/layout.h"
#include "tools/quorlog/wrap.h"

using namespace quor::cli;
using namespace quor::store;

namespace {

// A name; the text, as it is shown, that many columns wide, and in JSON.
const std::tuple<const char*, std::string, std::string, size_t, std::string> kTexts[] = {
    {"quotes", R"(a"b\c)", R"(a"b\c)", 5, R"("a\"b\\c")"},
    {"line breaks", "a\r\n\tb", R"(a\r\n\tb)", 8, R"("a\r\n\tb")"},
    {"terminal escape", "\033[2J", R"(\x1b[2J)", 7, R"("\u001b[2J")"},
    {"C1 control", "\xC2\x9B[m", R"(\u009b[m)", 8, R"("\u009b[m")"},
    {"direction override", std::string("a\xE2\x80") + "\xAE" + "b", R"(a\u202eb)", 8, R"("a\u202eb")"},
    {"tag character", "\xF3\xA0\x81\x81", R"(\U000e0041)", 10, R"("\udb40\udc41")"},
    {"combining mark", "e\xCC\x81", "e\xCC\x81", 1, "\"e\xCC\x81\""},
    {"wide", "\xE6\x97\xA5\xE6\x9C\xAC", "\xE6\x97\xA5\xE6\x9C\xAC", 4, "\"\xE6\x97\xA5\xE6\x9C\xAC\""},
    {"blank letters", "\u034f\u115f\u1160\u17b4\u17b5\u180b\u180f\u3164\uffa0",
     R"(\u034f\u115f\u1160\u17b4\u17b5\u180b\u180f\u3164\uffa0)", 54,
     R"("\u034f\u115f\u1160\u17b4\u17b5\u180b\u180f\u3164\uffa0")"},
    {"line separators", "\u2028\u2029", R"(\u2028\u2029)", 12, R"("\u2028\u2029")"},
    {"joiners", "a\u200c\u200d", "a\u200c\u200d", 1, "\"a\u200c\u200d\""},
    {"latin 1", "caf\xE9 x", R"(caf\xe9 x)", 9, R"("caf\\xe9 x")"},
    {"surrogate", "\xED\xA0\x80", R"(\xed\xa0\x80)", 12, R"("\\xed\\xa0\\x80")"},
};

TEST(Text, IsShownAndEncodedWithoutAnythingRaw) {
    for (const auto& [name, text, shown, width, encoded] : kTexts) {
        SCOPED_TRACE(name);
        std::string visible;
        EXPECT_EQ(AppendVisible(visible, text), width);
        EXPECT_EQ(visible, shown);
        std::string json;
        AppendVisibleJson(json, text);
        EXPECT_EQ(json, encoded);
    }
}

TEST(Text, WrapsAtWords) {
    using Lines = std::vector<std::string_view>;
    EXPECT_EQ(Wrap("", 5), Lines{""});
    EXPECT_EQ(Wrap("one two three", 7), (Lines{"one two", "three"}));
    EXPECT_EQ(Wrap("one two three", 6), (Lines{"one", "two", "three"}));
    EXPECT_EQ(Wrap("a abcdefgh b", 3), (Lines{"a", "abc", "def", "gh", "b"}));
    EXPECT_EQ(Wrap("a          b", 4), (Lines{"a", "b"}));
    EXPECT_EQ(Wrap("\u65e5\u672c\u8a9e", 5), (Lines{"\u65e5\u672c", "\u8a9e"})) << "wide letters";
    EXPECT_EQ(Wrap("abe\u0301c", 3), (Lines{"abe\u0301", "c"})) << "a mark stays with its letter";
}

// Whatever the texts are, no line of a table is wider than the screen, and nothing of a text is lost.
TEST(Text, FitsScreensOfAnyWidth) {
    const std::string wide = "\u65e5\u672c\U0001f469\u200d\U0001f469\u200d\U0001f467\u2764\ufe0f";
    const std::string mixed = "e\u0301\u05e9\u05dc\u05d5\u05dd \\x1b[2J " + wide;
    std::string longer = mixed + mixed + mixed;
    longer.append(" ").append(mixed).append(60, ' ').append(mixed);
    const Columns columns = {{"id", Kind::Number}, {"host"}, {"level"}, {"message"}, {"advice"}};
    for (size_t screen = 12; screen < 130; ++screen) {
        Layout layout(columns, screen);
        for (const std::string& text :
             {std::string(), std::string("short"), std::string(300, 'x'), wide, mixed, longer}) {
            Line line(columns.size());
            for (Cell& cell : line) {
                cell.width = AppendVisible(cell.text, text);
            }
            layout.widen(line);
            std::string out;
            layout.append(out, line);
            std::istringstream lines(out);
            for (std::string row; std::getline(lines, row);) {
                std::string visible;
                EXPECT_LE(AppendVisible(visible, row), screen) << row;
            }
            const auto inked = [](std::string all) {
                all.erase(std::remove_if(all.begin(), all.end(), [](char c) { return c == ' ' || c == '\n'; }),
                          all.end());
                return all.size();
            };
            EXPECT_EQ(inked(out), 5 * inked(text)) << out;
        }
    }
}

TEST(Moments, AreLocalDaysAndTimesThatExist) {
    setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);  // it changed its clocks on the night to 2026-03-29
    tzset();
    const time_t now = 1774823400;  // 2026-03-30 00:30 local time, 2026-03-29 22:30 UTC
    for (const char* text : {"", "2000-02-29", "2024-02-29", "2024-03-31", "2024-08-31", "2024-12-31"}) {
        EXPECT_EQ(ParseMoment(text, "--from", now).date, text);
    }
    const std::map<std::string, std::string> moments = {{"yesterday", "2026-03-29 "},
                                                        {"0d", "2026-03-30 "},
                                                        {"36500d", "1926-04-24 "},
                                                        {"2w", "2026-03-16 "},
                                                        {"now", "2026-03-30 00:30:00"},
                                                        {"90s", "2026-03-30 00:28:30"},
                                                        {"31m", "2026-03-29 23:59:00"},
                                                        {"23h", "2026-03-29 00:30:00"},
                                                        {"23:59", "2026-03-30 23:59:00"},
                                                        {"00:00:59", "2026-03-30 00:00:59"},
                                                        {"2026-11-21 10:00", "2026-11-21 10:00:00"},
                                                        {"2026-11-21T10:00:30", "2026-11-21 10:00:30"},
                                                        {"2026-11-21T10:00:30.25Z", "2026-11-21 11:00:30"},
                                                        {"2026-07-01T23:30:00-0130", "2026-07-02 03:00:00"},
                                                        {"2026-07-01T00:30:00+05:30", "2026-06-30 21:00:00"}};
    for (const auto& [text, moment] : moments) {
        const Moment parsed = ParseMoment(text, "--from", now);
        EXPECT_EQ(parsed.date + " " + parsed.time, moment) << text;
    }
    EXPECT_EQ(EndOf({"2026-03-29", ""}) - BeginOf({"2026-03-29", ""}), 23 * 3600 - 1) << "clocks changed";
    for (const char* text : {"1900-02-29",
                             "2023-02-29",
                             "2024-04-31",
                             "2024-06-31",
                             "2024-09-31",
                             "2024-11-31",
                             "2024-01-32",
                             "2024-01-00",
                             "2024-00-01",
                             "2024-13-01",
                             "2024-1-1",
                             "2024/01/01",
                             "0",
                             "7",
                             "-1d",
                             "36501d",
                             "99999999999d",
                             "24:00",
                             "10:60",
                             "10:00:60",
                             "1:00",
                             "d",
                             "h",
                             "1x",
                             "2026-11-21 24:00",
                             "2026-11-21T10:00+24:00",
                             "2026-11-21T10:00x",
                             "2026-11-21 10:00:00.x",
                             "2026-02-30 10:00"}) {
        EXPECT_THROW((void)ParseMoment(text, "--from", now), Failure) << text;
    }
    const std::map<std::string, uint64_t> spans = {
        {"90s", 90}, {"10m", 600}, {"6h", 21600}, {"2d", 172800}, {"1w", 604800}};
    for (const auto& [text, seconds] : spans) {
        EXPECT_EQ(ParseSpan(text, ""), seconds);
    }
}

}  // namespace
