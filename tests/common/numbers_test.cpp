#include "common/numbers.h"

#include <gtest/gtest.h>

#include <cstdlib>

TEST(Numbers, ReadAsTheCLibraryDoesAtEveryBoundary) {
    for (const char* text : {"",
                             "x",
                             "-",
                             "+",
                             "0",
                             "-0",
                             "12abc",
                             " \t\n42",
                             "+7",
                             "- 7",
                             "--7",
                             "0x10",
                             "2147483647",
                             "2147483648",
                             "-2147483648",
                             "-2147483649",
                             "4294967296",
                             "9223372036854775807",
                             "9223372036854775808",
                             "-9223372036854775808",
                             "-9223372036854775809",
                             "18446744073709551615",
                             "18446744073709551616",
                             "-1",
                             "-18446744073709551615",
                             "-18446744073709551616",
                             "99999999999999999999999",
                             "1.5",
                             "\xff\x31"}) {
        EXPECT_EQ(quor::ToInt64(text), strtoll(text, nullptr, 10)) << text;
        EXPECT_EQ(quor::ToUint64(text), strtoull(text, nullptr, 10)) << text;
    }
}

TEST(Numbers, SaturateAtThirtyTwoBits) {
    EXPECT_EQ(quor::ToInt32("2147483648"), INT32_MAX);
    EXPECT_EQ(quor::ToInt32("-99999999999999999999"), INT32_MIN);
    EXPECT_EQ(quor::ToInt32(nullptr), 0);
}
