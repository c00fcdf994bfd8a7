#include "tools/quorlog/output.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <map>

#include "store/dates.h"
#include "store/failure.h"
#include "tools/quorlog/display.h"

using namespace quor::cli;
using namespace quor::store;

namespace {

const Columns kColumns = {{"id", Kind::Number}, {"host"}, {"prio", Kind::Level}, {"msg"}};

// What a pipe gets, a terminal when `colored`.
std::string written(Format format, bool colored, const std::vector<Cells>& rows) {
    Style style;
    style.format = format;
    style.terminal = style.color = colored;
    int ends[2];
    EXPECT_EQ(pipe(ends), 0);
    Output out(ends[1]);
    const auto sink = MakeSink(style, kColumns, out);
    for (const Cells& cells : rows) {
        sink->row(cells);
    }
    sink->finish();
    close(ends[1]);
    std::string text(60000, '\0');
    text.resize(static_cast<size_t>(std::max<ssize_t>(0, read(ends[0], text.data(), text.size()))));
    close(ends[0]);
    return text;
}

const std::vector<Cells> kRows = {{"7", "web", "err", "a\"b"}, {"12", "\xE6\x97\xA5", "info", "-x,\033[m"}};

TEST(Output, EveryFormHoldsEveryRowAndATerminalSeesColoursOfOursOnly) {
    const std::string first = R"({"id":7,"host":"web","prio":"err","msg":"a\"b"})";
    EXPECT_EQ(written(Format::Ndjson, false, kRows),
              first + "\n{\"id\":12,\"host\":\"\xE6\x97\xA5\",\"prio\":\"info\",\"msg\":\"-x,\\u001b[m\"}\n");
    EXPECT_EQ(written(Format::Json, false, {kRows[0], kRows[0]}), "[" + first + ",\n" + first + "]\n");
    for (const bool terminal : {false, true}) {
        EXPECT_EQ(written(Format::Csv, terminal, kRows),
                  "id,host,prio,msg\r\n7,web,err,\"a\"\"b\"\r\n12,\xE6\x97\xA5,info,\"-x," +
                      std::string(terminal ? "\\x1b" : "\033") + "[m\"\r\n");
        EXPECT_EQ(written(Format::Table, terminal, kRows), "ID  HOST  PRIO  MSG\n 7  web   " +
                                                               std::string(terminal ? "\033[31merr\033[0m" : "err") +
                                                               "   a\"b\n12  \xE6\x97\xA5    info  -x,\\x1b[m\n");
    }
    EXPECT_EQ(written(Format::Json, false, {}) + written(Format::Csv, false, {}) + written(Format::Table, false, {}),
              "[]\nid,host,prio,msg\r\n");
}

TEST(Output, ALongTableStreamsInTheWidthsOfItsFirstRows) {
    const std::string longHost(60, 'h');
    std::vector<Cells> rows(300, Cells{"1", "web", "err", "m"});
    rows[9][1] = std::string_view(longHost).substr(0, 45);
    rows.push_back({"123", longHost, "err", "m"});
    const std::string table = written(Format::Table, false, rows);
    const std::string start = "ID  HOST" + std::string(38, ' ') + "PRIO  MSG\n 1  web" + std::string(39, ' ') + "err";
    EXPECT_EQ(table.substr(0, start.size()), start);
    EXPECT_EQ(table.substr(table.rfind('\n', table.size() - 2) + 1), "123  " + longHost + "  err   m\n");
}

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

TEST(Text, CsvCellsAreQuotedAndFormulasDefused) {
    const std::pair<const char*, const char*> cells[] = {
        {"=1,2", R"("'=1,2")"},  {"+1", "'+1"},     {"-1", "'-1"},
        {"@a", "'@a"},           {"\ta", "'\ta"},   {"\ra", "\"'\ra\""},
        {"\na", "\"'\na\""},     {"'a", "''a"},     {"a=", "a="},
        {" a", R"(" a")"},       {"a ", R"("a ")"}, {"", ""},
        {R"(a"b)", R"("a""b")"}, {"a'b", "a'b"}};
    for (const auto& [text, expected] : cells) {
        std::string defused;
        AppendCsvCell(defused, text, true);
        EXPECT_EQ(defused, expected);
        std::string plain;
        AppendCsvCell(plain, text, false);
        const bool formula = *text != '\0' && strchr("=+-@\t\r\n'", *text) != nullptr;
        EXPECT_EQ(plain.size(), defused.size() - (formula ? 1 : 0)) << text;
    }
}

// 2026-03-30 00:30 local time, 2026-03-29 22:30 UTC
std::string date(const std::string& text) {
    return ParseDate(text, "--from", 1774823400);
}

bool isRefused(const std::string& text) {
    try {
        (void)date(text);
        return false;
    } catch (const Failure&) {
        return true;
    }
}

TEST(Dates, AreLocalDaysThatExist) {
    setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", 1);  // it changed its clocks on the night to 2026-03-29
    tzset();
    const std::map<std::string, const char*> cases{{"", ""},
                                                   {"2024-02-29", "2024-02-29"},
                                                   {"yesterday", "2026-03-29"},
                                                   {"0d", "2026-03-30"},
                                                   {"365d", "2025-03-30"},
                                                   {"36500d", "1926-04-24"}};
    for (const auto& [text, expected] : cases) {
        EXPECT_EQ(date(text), expected) << text;
    }
    for (const int year : {1900, 2000, 2023, 2024}) {
        for (int i = 0; i <= 13 * 33; ++i) {
            tm day = {};
            day.tm_year = year - 1900;
            day.tm_mon = i / 33 - 1;
            day.tm_mday = i % 33;
            char text[16];
            (void)snprintf(text, sizeof text, "%04d-%02d-%02d", year, i / 33, i % 33);
            const bool exists = timegm(&day) != -1 && day.tm_mon == i / 33 - 1 && day.tm_mday == i % 33;
            EXPECT_EQ(isRefused(text), !exists) << text;
        }
    }
    for (const char* text : {"0", "36501d", "2024-1-1", "2024/01/01", "tomorrow", "-1d", "7", "99999999999d"}) {
        EXPECT_TRUE(isRefused(text)) << text;
    }
    const std::map<std::string, uint64_t> spans{{"90s", 90}, {"10m", 600}, {"6h", 21600}, {"2d", 172800}};
    for (const auto& [text, seconds] : spans) {
        EXPECT_EQ(ParseSpan(text, ""), seconds);
    }
}

}  // namespace
