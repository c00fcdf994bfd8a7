#include "common.h"

#include <json/value.h>
#include <syslog.h>

#include <sstream>

#include "base/numbers.h"
#include "common/handles.h"
#include "tests/support/testing.h"

namespace {

using quor::test::TakeSystemLog;
using Strings = std::list<std::string>;

// The entries stored for a file of this content, null ones as "(null)".
Strings reversed(const std::string& content, int maxLines, int count = 0) {
    const quor::test::TempFolder folder;
    const quor::File file(fopen(folder.write("lines", content).c_str(), "r"));
    char** lines = nullptr;
    EXPECT_EQ(readfileinreverse(file.get(), &lines, count, maxLines), -1);
    Strings entries;
    for (int i = 0; i < maxLines; ++i) {
        entries.emplace_back(lines[i] != nullptr ? lines[i] : "(null)");
        free(lines[i]);
    }
    free(lines);
    return entries;
}

TEST(Tokenize, KeepsEmptyFields) {
    EXPECT_EQ(Tokenize("", ","), Strings());
    EXPECT_EQ(Tokenize("a,,b;c,", ",;"), Strings({"a", "", "b", "c", ""}));
}

TEST(EncodeJson, EscapesQuotesAndBackslashesWithinTheBuffer) {
    char out[8] = "#######";
    EXPECT_EQ(EncodeJson("a\"\\\n\x01", out, 8), 0);
    EXPECT_STREQ(out, "a\\\"\\\\\n\x01");
    for (const int size : {7, 1, 0, -1}) {
        EXPECT_EQ(EncodeJson("a\"\\\n\x01", out, size), -1) << size;
    }
    EXPECT_EQ(EncodeJson("", out, 1), 0);
    for (const int result : {EncodeJson(out, out, 8), EncodeJson(nullptr, out, 8), EncodeJson("", nullptr, 8)}) {
        EXPECT_EQ(result, -1) << "in place, or nowhere";
    }
}

TEST(ReadFileInReverse, StoresLinesFromTheLast) {
    EXPECT_EQ(reversed("a\nb\n", 4), Strings({"", "b", "a", "(null)"}));
    EXPECT_EQ(reversed("a\nb", 5, 3), Strings({"(null)", "(null)", "(null)", "b", "a"}));
    EXPECT_EQ(reversed("a\nb\nc", 2), Strings({"c", "b"}));
    EXPECT_EQ(reversed("", 1), Strings{""});
    EXPECT_EQ(reversed("", 1, 1), Strings{"(null)"});
    EXPECT_EQ(reversed("a", 1, 1), Strings{"(null)"});
    EXPECT_EQ(reversed(std::string("x\0y\n", 4) + std::string(1030, 'x'), 2), Strings({std::string(1023, 'x'), "x"}));
}

TEST(ReadFileInReverse, LeavesNoArrayForLessThanNoLines) {
    char* uninitialised = nullptr;
    char** lines = &uninitialised;
    int count = 0;
    EXPECT_EQ(readfileinreverse(stdin, &lines, count, -1), -1);
    EXPECT_EQ(lines, nullptr);
}

TEST(CmdParser, CutsAfterEveryClosingBraceAndStopsAtTheFirstFailure) {
    // The command, the result, the values that were appended and the reason of a failure.
    const std::tuple<std::string, int, size_t, const char*> cases[] = {
        {"}}}", 1, 0, ""},
        {R"(}{"a":1}}{"b":2}})", 1, 2, ""},
        {R"({"a":{"b":1}})", 0, 0, "* Line 1"},
        {R"({"a":"}"})", 0, 0, "* Line 1"},
        {R"({"a":1}{"b"}{"c":1})", 0, 1, "* Line 1"},
        {R"({"a":1})" + std::string(1001, '['), 0, 1, "Exceeded stackLimit"},
    };
    for (const auto& [text, result, count, reason] : cases) {
        SCOPED_TRACE(text);
        TakeSystemLog();
        std::string input = text;
        std::vector<Json::Value> values{Json::Value(7)};
        EXPECT_EQ(CmdParser().CmdParse(input, values), result);
        EXPECT_EQ(values.size(), 1 + count) << "appended";
        const auto lines = TakeSystemLog();
        ASSERT_EQ(lines.size(), result == 1 ? 0U : 1U);
        EXPECT_TRUE(lines.empty() ||
                    lines[0].text.rfind("Error: parsing error, reason = " + std::string(reason), 0) == 0);
    }
}

TEST(Debuger, WritesOnlyLevelsBelowOneAndLeavesPercentSignsAlone) {
    TakeSystemLog();
    for (const int level : {-1, 0, 1, 2}) {
        Debuger::MSG(level, "100%s %n" + std::to_string(level));
    }
    const auto lines = TakeSystemLog();
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_EQ(lines[0].text + lines[1].text, "100%s %n-1100%s %n0");
    EXPECT_EQ(lines[0].priority, LOG_ERR);
}

TEST(Numbers, ReadAsTheCLibraryDoesAtEveryBoundary) {
    std::istringstream texts("x - 0 12abc +7 --7 0x10 2147483648 9223372036854775807 9223372036854775808 -1 "
                             "-9223372036854775808 -9223372036854775809 18446744073709551615 18446744073709551616 "
                             "-18446744073709551615 -18446744073709551616 99999999999999999999999");
    Strings all{"", " \t\n42", "- 7"};
    all.insert(all.end(), std::istream_iterator<std::string>(texts), {});
    for (const std::string& text : all) {
        EXPECT_EQ(quor::ToInt64(text.c_str()), strtoll(text.c_str(), nullptr, 10)) << text;
        EXPECT_EQ(quor::ToUint64(text.c_str()), strtoull(text.c_str(), nullptr, 10)) << text;
    }
    EXPECT_EQ(quor::ToInt32("2147483648"), INT32_MAX);
    EXPECT_EQ(quor::ToInt32("-99999999999999999999"), INT32_MIN);
}

}  // namespace
