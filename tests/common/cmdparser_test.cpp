#include <gtest/gtest.h>
#include <json/value.h>

#include "common.h"
#include "support/system_log.h"

using quor::test::TakeSystemLog;

TEST(CmdParser, CutsAfterEveryClosingBraceAndStopsAtTheFirstFailure) {
    struct Case {
        const char* input;
        int result;
        size_t values;
    };
    for (const Case& c :
         {Case{"", 1, 0}, Case{"}}}", 1, 0}, Case{R"({"a":1}{"b":2})", 1, 2}, Case{R"(}{"a":1}}{"b":2}})", 1, 2},
          Case{R"({"a":{"b":1}})", 0, 0}, Case{R"({"a":"}"})", 0, 0}, Case{R"({"a":1}{"b")", 0, 1},
          Case{R"({"a":1}{"b"}{"c":1})", 0, 1}}) {
        SCOPED_TRACE(c.input);
        TakeSystemLog();
        std::string input = c.input;
        std::vector<Json::Value> values;
        EXPECT_EQ(CmdParser().CmdParse(input, values), c.result);
        EXPECT_EQ(values.size(), c.values);

        const auto lines = TakeSystemLog();
        ASSERT_EQ(lines.size(), c.result == 1 ? 0U : 1U);
        if (!lines.empty()) {
            EXPECT_EQ(lines[0].text.rfind("Error: parsing error, reason = * Line 1", 0), 0U) << lines[0].text;
        }
    }
}

TEST(CmdParser, AppendsToWhatIsThere) {
    std::string input = R"({"a":1}{"a":2})";
    std::vector<Json::Value> values{Json::Value(7)};
    ASSERT_EQ(CmdParser().CmdParse(input, values), 1);
    ASSERT_EQ(values.size(), 3U);
    EXPECT_EQ(values[0].asInt(), 7);
    EXPECT_EQ(values[2]["a"].asInt(), 2);
}
