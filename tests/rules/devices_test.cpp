// Devices that go silent, grow loud or are new. Time is that of the logs, and of the ticks when there are none.
#include <chrono>
#include <regex>

#include "rules/devicewatch.h"
#include "rules/rulefile.h"
#include "tests/support/testing.h"

using namespace quor::rules;
using namespace quor::test;

namespace {

constexpr int64_t kStart = 1795238154;

class Devices : public testing::Test {
  protected:
    void setRules(const std::string& sections) { watch_.setRules(ParseRules("version=\"1\"\n" + sections, "FILE")); }

    void hear(const std::string& device) { watch_.hear(device, second_); }

    // Lets time pass, in which each of the devices sends a log every `period` seconds.
    void run(int64_t seconds, const Strings& devices, int64_t period = 10) {
        for (int64_t i = 0; i < seconds; ++i) {
            ++second_;
            now_ += std::chrono::seconds(1);
            watch_.elapse(1);
            for (const std::string& device : devices) {
                if (second_ % period == 0) {
                    hear(device);
                }
            }
            if (second_ % 5 == 0) {
                look();
            }
        }
    }
    void look() {
        watch_.judge();
        for (const Report& report : watch_.takeReports(now_)) {
            static const char* const kNames[] = {"silent", "back", "loud", "new"};
            told_.push_back(std::string(kNames[static_cast<size_t>(report.what)]) + " " +
                            std::regex_replace(report.devices, std::regex(" \\([^)]*\\)"), ""));
        }
    }
    Strings told() { return std::exchange(told_, {}); }

    // The process ends, and another one begins.
    void restart(bool clean) {
        DeviceWatch next(1000);
        ASSERT_TRUE(next.load(watch_.save(clean)));
        watch_ = std::move(next);
        setRules(rules_);
    }

    DeviceWatch watch_{1000};
    std::string rules_ = "[s]\nkind=silent\nafter=30m\ninterval=0s\n";
    int64_t second_ = kStart;
    DeviceWatch::Time now_{};
    Strings told_;
};

using Silence = Devices;
using Rates = Devices;
using NewDevices = Devices;

}  // namespace

TEST_F(Silence, IsToldOnceAndSoIsItsEnd) {
    setRules(rules_);
    run(600, {"a", "b", "c"});
    run(1700, {"a", "b"});
    EXPECT_EQ(told(), Strings());
    run(200, {"a", "b"});
    EXPECT_EQ(told(), Strings{"silent c"});
    restart(true);
    run(7200, {"a", "b"});
    restart(false);
    EXPECT_EQ(told(), Strings());
    run(20, {"a", "b", "c"});
    EXPECT_EQ(told(), Strings{"back c"});
    run(3600, {"a", "b", "c"});
    EXPECT_EQ(told(), Strings());
}

TEST_F(Silence, OfAllIsOneNoticeAndNoDevicesFault) {
    setRules(rules_);
    Strings many;
    for (int i = 0; i < 100; ++i) {
        many.push_back("d" + std::to_string(i));
    }
    run(600, many);
    run(1790, {});
    EXPECT_EQ(told(), Strings());
    run(7200, {});
    EXPECT_EQ(told(), Strings{"silent any of 100 devices"});
    hear("d7");
    run(10, {"d7"});
    EXPECT_EQ(told(), Strings{"back d7"});
    run(1200, {"d7", "d8"});
    EXPECT_EQ(told(), Strings()) << "the others get their time again";
    run(1200, {"d7", "d8"});
    ASSERT_EQ(told().size(), 1U) << "and are one notice then";
}

// A log tells how late it is: a stop of the process, a sleep of the machine and a set clock are alike.
TEST_F(Silence, IsNotWhatAJumpOfTheClockLooksLike) {
    setRules(rules_);
    run(1200, {"a", "b", "c"});
    for (const int64_t jump : {7200, -7200, 86400, -100, 100}) {
        second_ += jump;
        run(300, {"a"});
        run(30, {"a", "b", "c"});
        EXPECT_EQ(told(), Strings()) << jump;
    }
    restart(false);
    second_ += 7200;
    run(300, {"a"});
    run(300, {"a", "b", "c"});
    EXPECT_EQ(told(), Strings());
    run(2500, {"a", "b"});
    EXPECT_EQ(told(), Strings{"silent c"}) << "it still hears";
}

TEST_F(Silence, OfTheOnlyDeviceIsFound) {
    setRules(rules_);
    run(36000, {"a"}, 600);
    run(2400, {});
    EXPECT_EQ(told(), Strings{"silent a"});
    run(600, {"a"}, 600);
    EXPECT_EQ(told(), Strings{"back a"});
}

TEST_F(Silence, OfANamedDeviceNeedsNoLogOfIt) {
    rules_ = "[s]\nkind=silent\nafter=30m\nhost=\"never,x*\"\ninterval=0s\n";
    setRules(rules_);
    watch_.know("xknown");  // counted long ago
    run(1900, {"a"});
    EXPECT_EQ(told(), Strings{"silent never"});
    run(20, {"a", "never"});
    EXPECT_EQ(told(), Strings{"back never"});
}

TEST_F(Silence, IsLearntFromEachDevicesRhythm) {
    rules_ = "[s]\nkind=silent\nafter=auto\ninterval=0s\n";
    setRules(rules_);
    for (int i = 0; i < 48; ++i) {
        hear("hourly");
        for (int burst = 0; burst < 1000; ++burst) {
            hear("burst");
        }
        run(3600, {"steady"}, 60);
    }
    EXPECT_EQ(told(), Strings());
    run(2000, {"other"});
    EXPECT_EQ(told(), Strings{"silent steady"}) << "ten minutes at least";
    run(6000, {"other"});
    EXPECT_EQ(told(), (Strings{"silent burst, hourly"})) << "twice an hour";
    hear("hourly");
    run(86400, {"other"});
    EXPECT_EQ(told(), (Strings{"back hourly", "silent hourly"})) << "two hours are not learnt as usual at once";
}

TEST_F(Rates, AreToldOnceUntilTheyFall) {
    rules_ = "[r]\nkind=rate\nfactor=10\ninterval=0s\n";
    setRules(rules_);
    const auto flood = [this](int logs) {
        for (int i = 0; i < logs; ++i) {
            hear("a");
        }
    };
    flood(5000);
    EXPECT_EQ(told(), Strings()) << "nothing is known yet";
    run(604800, {"a", "b"});
    EXPECT_EQ(told(), Strings());
    flood(50);
    run(60, {"a", "b"});
    EXPECT_EQ(told(), Strings()) << "60 a minute are never too many";
    for (int minute = 0; minute < 5; ++minute) {
        flood(1000);
        run(60, {"a", "b"});
    }
    EXPECT_EQ(told(), Strings{"loud a"});
    restart(true);
    flood(1000);
    run(604800, {"a", "b"});
    EXPECT_EQ(told(), Strings()) << "held until it fell";
    flood(1000);
    run(20, {"a", "b"});
    EXPECT_EQ(told(), Strings{"loud a"});
}

TEST_F(NewDevices, AreToldTogetherWithTheirNumber) {
    rules_ = "[n]\nkind=newdevice\nnot-host=\"x*\"\ninterval=5m\n";
    watch_.know("known");
    setRules(rules_);
    run(10, {"known", "xa"});
    EXPECT_EQ(told(), Strings());
    for (int i = 0; i < 2000; ++i) {
        hear("n" + std::to_string(i));
    }
    watch_.hearOther(second_);
    run(10, {});
    EXPECT_EQ(told(), Strings{"new n0, n1, n2, n3, n4, n5, n6, n7, n8, n9 and 988 more; 1 logs came from names beyond "
                              "those that are kept apart"})
        << "of 1000 places";
    hear("n1");
    run(400, {"known"});
    EXPECT_EQ(told(), Strings());
}

TEST_F(Devices, StateThatIsNoneChangesNothing) {
    setRules(rules_);
    run(600, {"a", "odd \n%name"});
    const std::string good = watch_.save(true);
    for (const char* bad : {"", "x", "quorlogd-rules 1 clean\nrule 9 0 =a =\n", "quorlogd-rules 1 clean\ndevice 1 =a\n",
                            "quorlogd-rules 1 clean\ntold =a\n"}) {
        EXPECT_FALSE(watch_.load(bad)) << bad;
    }
    EXPECT_EQ(watch_.save(true), good);
    restart(true);
    EXPECT_EQ(watch_.save(true).size(), good.size());
}
