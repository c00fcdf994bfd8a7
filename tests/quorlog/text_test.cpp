#include "text.h"

#include <gtest/gtest.h>

using namespace quor::cli;

namespace {

struct TextCase {
    const char* name;
    std::string text;
    std::string visible;
    size_t width;
    std::string json;
};

const TextCase kTexts[] = {
    {"ascii", "a b~", "a b~", 4, R"("a b~")"},
    {"quotes", R"(a"b\c)", R"(a"b\c)", 5, R"("a\"b\\c")"},
    {"line breaks", "a\r\n\tb", R"(a\r\n\tb)", 8, R"("a\r\n\tb")"},
    {"terminal escape", "\033[2J", R"(\x1b[2J)", 7, R"("\u001b[2J")"},
    {"zero byte", std::string("a\0b", 3), R"(a\x00b)", 6, R"("a\u0000b")"},
    {"C1 control",
     "\xC2\x9B"
     "31m",
     R"(\u009b31m)", 9, R"("\u009b31m")"},
    {"direction override", std::string("a\xE2\x80") + "\xAE" + "b", R"(a\u202eb)", 8, R"("a\u202eb")"},
    {"tag character", "\xF3\xA0\x81\x81", R"(\U000e0041)", 10, R"("\udb40\udc41")"},
    {"two bytes", "\xC3\xA9", "\xC3\xA9", 1, "\"\xC3\xA9\""},
    {"combining mark", "e\xCC\x81", "e\xCC\x81", 1, "\"e\xCC\x81\""},
    {"wide", "\xE6\x97\xA5\xE6\x9C\xAC", "\xE6\x97\xA5\xE6\x9C\xAC", 4, "\"\xE6\x97\xA5\xE6\x9C\xAC\""},
    {"emoji", "\xF0\x9F\x94\xA5!", "\xF0\x9F\x94\xA5!", 3, "\"\xF0\x9F\x94\xA5!\""},
    {"latin 1", "caf\xE9 x", R"(caf\xe9 x)", 9, R"("caf\\xe9 x")"},
    {"cut off", "a\xE6\x97", R"(a\xe6\x97)", 9, R"("a\\xe6\\x97")"},
    {"overlong slash", "\xC0\xAF", R"(\xc0\xaf)", 8, R"("\\xc0\\xaf")"},
    {"surrogate", "\xED\xA0\x80", R"(\xed\xa0\x80)", 12, R"("\\xed\\xa0\\x80")"},
    {"beyond the last plane", "\xF4\x90\x80\x80", R"(\xf4\x90\x80\x80)", 16, R"("\\xf4\\x90\\x80\\x80")"},
};

TEST(Text, IsShownAndEncodedWithoutAnythingRaw) {
    for (const TextCase& test : kTexts) {
        SCOPED_TRACE(test.name);
        std::string visible;
        EXPECT_EQ(AppendVisible(visible, test.text), test.width);
        EXPECT_EQ(visible, test.visible);
        std::string json;
        AppendJsonString(json, test.text);
        EXPECT_EQ(json, test.json);
    }
}

TEST(Text, CsvCellsAreQuotedAndFormulasDefused) {
    const struct {
        const char* text;
        const char* plain;
        const char* safe;
    } cases[] = {
        {"", "", ""},
        {"a b", "a b", "a b"},
        {"a,b", R"("a,b")", R"("a,b")"},
        {R"(say "x")", R"("say ""x""")", R"("say ""x""")"},
        {"a\nb", "\"a\nb\"", "\"a\nb\""},
        {" a", "\" a\"", "\" a\""},
        {"=1+1", "=1+1", "'=1+1"},
        {"@SUM(A1,A2)", R"x("@SUM(A1,A2)")x", R"x("'@SUM(A1,A2)")x"},
        {"-1", "-1", "'-1"},
        {"\tx", "\tx", "'\tx"},
        {"'quoted'", "'quoted'", "''quoted'"},
        {"a=b", "a=b", "a=b"},
    };
    for (const auto& test : cases) {
        std::string plain;
        std::string safe;
        AppendCsvCell(plain, test.text, false);
        AppendCsvCell(safe, test.text, true);
        EXPECT_EQ(plain, test.plain);
        EXPECT_EQ(safe, test.safe);
    }
}

}  // namespace
