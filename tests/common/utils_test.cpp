#include <gtest/gtest.h>

#include <climits>
#include <cstring>

#include "common.h"
#include "common/guards.h"
#include "support/temp_folder.h"

using Strings = std::list<std::string>;

TEST(Tokenize, KeepsEmptyFields) {
    EXPECT_EQ(Tokenize("", ","), Strings());
    EXPECT_EQ(Tokenize("abc", ","), Strings({"abc"}));
    EXPECT_EQ(Tokenize("a,,b", ","), Strings({"a", "", "b"}));
    EXPECT_EQ(Tokenize(",", ","), Strings({"", ""}));
    EXPECT_EQ(Tokenize("a;b,c", ",;"), Strings({"a", "b", "c"}));
}

TEST(UllNumberToString, ReachesBothEnds) {
    EXPECT_EQ(ullNumberToString(0), "0");
    EXPECT_EQ(ullNumberToString(ULLONG_MAX), "18446744073709551615");
}

TEST(EncodeJson, EscapesQuotesAndBackslashesWithinTheBuffer) {
    struct Case {
        const char* in;
        int size;
        const char* out;  // null: does not fit
    };
    for (const Case& c : {Case{"", 1, ""}, Case{"", 0, nullptr}, Case{"a\"b", 5, "a\\\"b"}, Case{"a\"b", 4, nullptr},
                          Case{"\\", 3, "\\\\"}, Case{"\\", 2, nullptr}, Case{"\\", 1, nullptr},
                          Case{"\t\n\x01", 4, "\t\n\x01"}, Case{"ab", -1, nullptr}}) {
        SCOPED_TRACE(testing::Message() << '"' << c.in << "\" into " << c.size);
        char out[8] = "#######";
        EXPECT_EQ(EncodeJson(c.in, out, c.size), c.out != nullptr ? 0 : -1);
        if (c.out != nullptr) {
            EXPECT_STREQ(out, c.out);
        }
        EXPECT_EQ(out[c.size < 0 ? 0 : c.size], '#') << "written past the size";
    }
    char same[] = "a";
    EXPECT_EQ(EncodeJson(same, same, 2), -1);
    EXPECT_EQ(EncodeJson(nullptr, same, 2), -1);
    EXPECT_EQ(EncodeJson(same, nullptr, 2), -1);
}

namespace {

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

}  // namespace

TEST(ReadFileInReverse, StoresLinesFromTheLast) {
    EXPECT_EQ(reversed("a\nb\n", 4), Strings({"", "b", "a", "(null)"}));
    EXPECT_EQ(reversed("a\nb", 2), Strings({"b", "a"}));
    EXPECT_EQ(reversed("a\nb\nc", 2), Strings({"c", "b"}));
    EXPECT_EQ(reversed("", 2), Strings({"", "(null)"}));
    EXPECT_EQ(reversed("\n", 2), Strings({"", ""}));
    EXPECT_EQ(reversed("a\nb", 5, 3), Strings({"(null)", "(null)", "(null)", "b", "a"}));
    EXPECT_EQ(reversed("a", 2, 2), Strings({"(null)", "(null)"}));
    EXPECT_EQ(reversed(std::string("x\0y\nz", 5), 2), Strings({"z", "x"}));
}

TEST(ReadFileInReverse, CutsLongLines) {
    const std::string line = "begin" + std::string(1'018, 'm') + "end";
    EXPECT_EQ(reversed(line + "\n" + line, 2), Strings({line.substr(0, 1023), line.substr(0, 1023)}));
}
