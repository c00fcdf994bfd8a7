#include <gtest/gtest.h>

#include "common.h"
#include "quorlogd/bounds.h"
#include "quorlogd/linesplitter.h"
#include "quorlogd/noticetext.h"

using Texts = std::vector<std::string>;

TEST(LineSplitter, GivesTheSameLinesForAnyChunking) {
    const std::string longest(10, 'x');
    const std::string text = "one\n\n\ntwo" + std::string(1, '\0') + "2\n" + longest + "\n" + longest + "y" +
                             std::string(5000, 'z') + "\nlast";
    const Texts expected{"one", "two" + std::string(1, '\0') + "2", longest, longest, "last"};
    for (const size_t chunk : {size_t{1}, size_t{2}, size_t{7}, size_t{11}, size_t{64}, text.size()}) {
        quor::LineSplitter splitter(longest.size());
        Texts lines;
        const auto keep = [&lines](const std::string& line) { lines.push_back(line); };
        for (size_t pos = 0; pos < text.size(); pos += chunk) {
            splitter.feed(std::string_view(text).substr(pos, chunk), keep);
        }
        splitter.finish(keep);
        EXPECT_EQ(lines, expected) << chunk;
        EXPECT_EQ(splitter.oversized(), 1U) << chunk;
    }
}

TEST(NoticeContent, FitsTheNoticeWhateverNeedsEscaping) {
    for (const std::string piece : {"a", "\"", "\u20ac", "\x80"}) {
        for (size_t bytes = 1000; bytes < 2100; ++bytes) {
            std::string message(bytes % piece.size(), '-');
            while (message.size() < bytes) {
                message += piece;
            }
            const std::string content = quor::NoticeContent(message);
            char escaped[2048];
            const bool fits = EncodeJson(message.c_str(), escaped, sizeof escaped) == 0;
            ASSERT_EQ(content == message, fits) << bytes;
            ASSERT_EQ(EncodeJson(content.c_str(), escaped, sizeof escaped), 0) << bytes;
            if (fits) {
                continue;
            }
            const std::string kept = content.substr(0, content.size() - 6);
            ASSERT_EQ(message.substr(0, kept.size()) + " [...]", content);
            ASSERT_GT(strlen(escaped), 2037U) << "cut too early";
            ASSERT_TRUE(piece.size() < 3 || (kept.size() - bytes % 3) % 3 == 0) << "cut inside a character";
        }
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
    EXPECT_FALSE(quor::NoticeBudget(0, now).take(now + std::chrono::hours(1)));
}

TEST(DeviceNames, AreBounded) {
    quor::DeviceNames names(2);
    EXPECT_EQ(names.admit("a"), "a");
    EXPECT_EQ(names.admit(std::string(256, 'x')), "(other devices)");
    EXPECT_EQ(names.admit("b"), "b");
    EXPECT_EQ(names.admit("c"), "(other devices)");
    EXPECT_EQ(names.admit("a"), "a");
    EXPECT_EQ(names.count(), 2U);
}
