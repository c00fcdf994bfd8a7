#include <gtest/gtest.h>

#include "store/event.h"
#include "tools/quorlogd/alarms.h"
#include "tools/quorlogd/devices.h"
#include "tools/quorlogd/noticetext.h"

using std::chrono::seconds;

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
    EXPECT_EQ(quor::store::EventText("it's <b>\x1b[2J\n\xc3\xa9"), "it''s \u2039b> [2J \xc3\xa9");
}

TEST(Alarms, ShareTheNoticesOfAMinute) {
    quor::Alarms::Time now{};
    quor::Alarms alarms(12, now);
    const auto granted = [&](const std::string& device, int tries) {
        int count = 0;
        while (tries-- > 0) {
            count += alarms.grant("kind", device, now) ? 1 : 0;
        }
        return count;
    };
    EXPECT_EQ(granted("loud", 100), 2) << "its share";
    EXPECT_EQ(granted("second", 100) + granted("third", 100), 4);
    EXPECT_EQ(granted("loud", 100), 0);
    EXPECT_EQ(granted("fourth", 1) + granted("fifth", 1), 2) << "the half that is kept for devices not heard yet";
    EXPECT_EQ(granted("fourth", 1), 0) << "but not for those that were";
    const auto heldBack = alarms.takeHeldBack();
    ASSERT_EQ(heldBack.size(), 4U);
    EXPECT_EQ(heldBack[0], (std::pair<std::string, uint64_t>("loud", 198)));
    EXPECT_TRUE(alarms.takeHeldBack().empty());
    now += seconds(60);
    EXPECT_EQ(granted("loud", 100), 2);
}

TEST(Alarms, AskTheIntervalFirst) {
    quor::Alarms::Time now{};
    quor::Alarms alarms(600, now);
    alarms.setInterval("kind", 30);
    for (const auto& [later, wanted] : {std::pair(0, 1), {29, 0}, {1, 1}}) {
        now += seconds(later);
        int taken = 0;
        for (int i = 0; i < 1000; ++i) {
            taken += alarms.grant("kind", "device", now) ? 1 : 0;
        }
        EXPECT_EQ(taken, wanted) << later;
    }
    EXPECT_TRUE(alarms.grant("other", "device", now)) << "what the interval held back cost nothing";
    EXPECT_TRUE(alarms.grant("kind", "another", now));
}

TEST(Devices, AreBoundedForEachAddressAndMakeRoom) {
    quor::Devices devices(300);
    const std::string others = "(other devices)";
    devices.know("known");
    for (int i = 0; i < 256; ++i) {
        EXPECT_EQ(devices.admit("x" + std::to_string(i), "10.0.0.1", 1), "x" + std::to_string(i));
    }
    EXPECT_EQ(devices.admit("invented", "10.0.0.1", 1), others);
    EXPECT_EQ(devices.admit("router", "10.0.0.2", 1), "router");
    EXPECT_EQ(devices.admit(std::string(256, 'x'), "10.0.0.2", 1), others);
    for (const char* name : {"known", "x0", "router"}) {
        EXPECT_EQ(devices.admit(name, "10.0.0.1", 2), name) << "not new";
    }
    EXPECT_EQ(devices.admit("invented", "10.0.0.1", 2), "invented") << "another day";
    for (int i = 0; i < 100; ++i) {
        (void)devices.admit("y" + std::to_string(i), "10.0.0.3", 2);
    }
    EXPECT_EQ(devices.count(), 300U);
    EXPECT_EQ(devices.admit("late", "10.0.0.4", 2), others) << "all were heard within a day";
    EXPECT_EQ(devices.admit("late", "10.0.0.4", 3), "late");
    EXPECT_EQ(devices.admit("x0", "10.0.0.1", 3), "x0") << "heard later than those that gave way";
}
