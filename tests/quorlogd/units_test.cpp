#include <gtest/gtest.h>

#include "tools/quorlogd/bounds.h"
#include "tools/quorlogd/linesplitter.h"
#include "tools/quorlogd/noticetext.h"

using Texts = std::vector<std::string>;

TEST(LineSplitter, KeepsZeroBytesAndTheLongestLineThatIsAllowed) {
    for (const size_t chunk : {1U, 2U, 7U, 100U}) {
        const std::string text("a\n\n\nb\0c\n12345\n123456789\nlast", 28);
        quor::LineSplitter splitter(5);
        Texts lines;
        const auto keep = [&lines](const std::string& line) { lines.push_back(line); };
        for (size_t pos = 0; pos < text.size(); pos += chunk) {
            splitter.feed(std::string_view(text).substr(pos, chunk), keep);
        }
        splitter.finish(keep);
        EXPECT_EQ(lines, (Texts{"a", {"b\0c", 3}, "12345", "12345", "last"})) << chunk;
    }
}

TEST(FitForNotice, FitsTheNoticeWhateverNeedsEscaping) {
    EXPECT_EQ(quor::FitForNotice(std::string(2047, 'a')), std::string(2047, 'a'));
    EXPECT_EQ(quor::FitForNotice(std::string(2048, 'a')), std::string(2041, 'a') + " [...]");
    EXPECT_EQ(quor::FitForNotice(std::string(1024, '"')), std::string(1020, '"') + " [...]");
    for (size_t before = 0; before < 3; ++before) {
        std::string message(before, '-');
        for (int i = 0; i < 700; ++i) {
            message += "\u20ac";
        }
        const std::string content = quor::FitForNotice(message);
        const size_t kept = content.size() - 6;
        EXPECT_EQ(content, message.substr(0, kept) + " [...]");
        EXPECT_EQ((kept - before) % 3, 0U) << "cut inside a character";
        EXPECT_GT(kept, 2037U) << "cut too early";
    }
}

TEST(EventText, IsALiteralAndNoMarkup) {
    EXPECT_EQ(quor::EventText("it's <b>\x1b[2J\n\xc3\xa9"), "it''s \u2039b> [2J \xc3\xa9");
}

TEST(NoticeBudget, RefillsOverAMinute) {
    quor::NoticeBudget::Time now{};
    quor::NoticeBudget budget(2, now);
    for (const auto& [seconds, wanted] : {std::pair(0, 2), {29, 0}, {2, 1}, {3600, 2}}) {
        now += std::chrono::seconds(seconds);
        int taken = 0;
        while (budget.take(now)) {
            ++taken;
        }
        EXPECT_EQ(taken, wanted) << "after " << seconds << " more seconds";
    }
}

TEST(DeviceNames, AreBounded) {
    quor::DeviceNames names(2);
    EXPECT_EQ(names.admit("a"), "a");
    EXPECT_EQ(names.admit(std::string(256, 'x')), "(other devices)");
    EXPECT_EQ(names.admit("b"), "b");
    EXPECT_EQ(names.admit("c"), "(other devices)");
    EXPECT_EQ(names.admit("a"), "a");
}
