#include <gtest/gtest.h>

#include <string>

#include "common/guards.h"

namespace {

TEST(StringTable, KeepsManyEntriesReplacesAndCopies) {
    quor::StringTable table(QLIBCSzHashAlloc(1));
    for (int i = 0; i < 1000; ++i) {
        std::string key = "key" + std::to_string(i);
        ASSERT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key.c_str(), "old"), 0);
        ASSERT_EQ(QLIBCSzHashSetValue(quor::Adopt(table), key.c_str(), std::to_string(i).c_str()), 0);
        key.assign(key.size(), 'x');
    }
    EXPECT_STREQ(QLIBCSzHashGetValue(table.get(), "key0"), "0");
    EXPECT_STREQ(QLIBCSzHashGetValue(table.get(), "key999"), "999");
    EXPECT_EQ(QLIBCSzHashGetValue(table.get(), "key1000"), nullptr);
}

TEST(CoreLibrary, RefusesNonsense) {
    quor::StringTable table(QLIBCSzHashAlloc(8));
    QLIBSZHASH* none = nullptr;
    EXPECT_EQ(QLIBCSzHashAlloc(0), nullptr);
    EXPECT_LT(QLIBCSzHashSetValue(nullptr, "k", "v"), 0);
    EXPECT_LT(QLIBCSzHashSetValue(&none, "k", "v"), 0);
    EXPECT_LT(QLIBCSzHashSetValue(quor::Adopt(table), nullptr, "v"), 0);
    EXPECT_LT(QLIBCSzHashSetValue(quor::Adopt(table), "k", nullptr), 0);
    EXPECT_EQ(QLIBCSzHashGetValue(nullptr, "k"), nullptr);
    EXPECT_EQ(QLIBCSzHashGetValue(table.get(), nullptr), nullptr);
    EXPECT_EQ(QLIBCSzListAlloc(-1), nullptr);
    EXPECT_EQ(QLIBCFileExist(nullptr), 0);
    EXPECT_LT(QLIBCExec(nullptr), 0);
    QLIBCSzHashFree(nullptr);
    QLIBCSzListFree(nullptr);
    QLIBCStrPut(nullptr);
}

TEST(FormattedText, IsAsLongAsItTakes) {
    const std::string long_text(100000, '%');
    EXPECT_EQ(quor::PlatformText(QLIBCStrGet("[%s] %d", long_text.c_str(), -1)).get(), "[" + long_text + "] -1");
}

}  // namespace
