#include "logger/event_fixture.h"

namespace {

using quor::test::EventLog;
using quor::test::Strings;

TEST_F(EventLog, EveryEventOfThePackageHasItsLevelAndText) {
    quor::test::SetClock(5);
    int failures = logger_.LogAddServStart("%n a") + logger_.LogAddServStop("a") + logger_.LogAddNotifyEps(UINT64_MAX);
    failures += logger_.LogAddNotifySev("any", "c") + logger_.LogAddNotifySev(SYSLOG_PRIORITY_WARNING, "c");
    failures += logger_.LogAddNotifyKw("k", "c") + logger_.LogAddArchStart("d") + logger_.LogAddArchFinish("d");
    failures += logger_.LogAddArchFailed("d") + logger_.LogAddLogClear("/%s.db", "admin") + logger_.LogAddVolFull();
    EXPECT_EQ(failures, 0);
    EXPECT_EQ(
        stored(own_),
        Strings({"0 5 SYSTEM Server was started [%n a].", "0 5 SYSTEM Server was stopped [a].",
                 "0 5 SYSTEM Event detection: EPS is larger than [18446744073709551615].",
                 "0 5 SYSTEM Event detection: Received log which severity is [any]. Log content: [c]",
                 "0 5 SYSTEM Event detection: Received log which severity is [warning]. Log content: [c]",
                 "0 5 SYSTEM Event detection: Received log which contains [k]. Log content: [c]",
                 "0 5 SYSTEM Log database [d] starts to archive.", "0 5 SYSTEM Log database [d] has been archived.",
                 "0 5 SYSTEM Log database [d] is failed to archived.", "0 5 SYSTEM /%s.db was cleared by admin",
                 "1 5 SYSTEM Volume space is not enough."}));
    EXPECT_EQ(logger_.LogAddNotifySev(SYSLOG_PRIORITY_ERR, "user 'root'"), -1);
    EXPECT_EQ(lastMessage(), "Fail to add log");
    EXPECT_EQ(logger_.LogCount(own_), 11);
}

TEST(LevelName, IsCutToTheBufferAndEmptyWhenUnknown) {
    char buffer[8] = "?";
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_STREQ(buffer, "War");
    EXPECT_EQ(szLevelGet(1, nullptr, 4), -1);
    EXPECT_EQ(szLevelGet(0, buffer, -1), 0);
    EXPECT_EQ(buffer + strLevelGet(0) + strLevelGet(2) + strLevelGet(3) + strLevelGet(-1), "WarInformationError");
}

}  // namespace
