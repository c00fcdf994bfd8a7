#include <functional>

#include "logger/event_fixture.h"

namespace {

using quor::test::EventLog;
using quor::test::Strings;

TEST_F(EventLog, EveryEventOfThePackageHasItsLevelAndText) {
    const struct {
        std::function<int(Logger&)> add;
        const char* level;
        const char* text;
    } cases[] = {
        {[](Logger& l) { return l.LogAddServStart("%n a"); }, "0", "Server was started [%n a]."},
        {[](Logger& l) { return l.LogAddServStop("a"); }, "0", "Server was stopped [a]."},
        {[](Logger& l) { return l.LogAddNotifyEps(UINT64_MAX); }, "0",
         "Event detection: EPS is larger than [18446744073709551615]."},
        {[](Logger& l) { return l.LogAddNotifySev("err", "c"); }, "0",
         "Event detection: Received log which severity is [err]. Log content: [c]"},
        {[](Logger& l) { return l.LogAddNotifySev(SYSLOG_PRIORITY_WARNING, "c"); }, "0",
         "Event detection: Received log which severity is [warning]. Log content: [c]"},
        {[](Logger& l) { return l.LogAddNotifyKw("k", "c"); }, "0",
         "Event detection: Received log which contains [k]. Log content: [c]"},
        {[](Logger& l) { return l.LogAddArchStart("d"); }, "0", "Log database [d] starts to archive."},
        {[](Logger& l) { return l.LogAddArchFinish("d"); }, "0", "Log database [d] has been archived."},
        {[](Logger& l) { return l.LogAddArchFailed("d"); }, "0", "Log database [d] is failed to archived."},
        {[](Logger& l) { return l.LogAddLogClear("/a/%s.db", "admin"); }, "0", "/a/%s.db was cleared by admin"},
        {[](Logger& l) { return l.LogAddVolFull(); }, "1", "Volume space is not enough."},
    };
    quor::test::SetClock(5);
    Strings wanted;
    for (const auto& row : cases) {
        EXPECT_EQ(row.add(logger_), 0) << row.text;
        wanted.insert(wanted.end(), {row.level, "5", "SYSTEM", row.text});
    }
    EXPECT_EQ(stored(quor::paths::kEventDb), wanted);
}

TEST_F(EventLog, ReportsAnEventThatCannotBeStored) {
    ASSERT_EQ(logger_.LogAddVolFull(), 0);
    EXPECT_EQ(logger_.LogAddNotifySev(SYSLOG_PRIORITY_ERR, "user 'root'"), -1);
    EXPECT_EQ(lastMessage(), "Fail to add log");
    EXPECT_EQ(logger_.LogCount(quor::paths::kEventDb), 1);
}

TEST(LevelName, IsCutToTheBufferAndEmptyWhenUnknown) {
    char buffer[8] = "?";
    EXPECT_EQ(szLevelGet(1, buffer, 4), 0);
    EXPECT_STREQ(buffer, "War");
    EXPECT_EQ(szLevelGet(1, nullptr, 4), -1);
    EXPECT_EQ(szLevelGet(2, buffer, 8), 0);
    EXPECT_STREQ(buffer, "Error");
    EXPECT_EQ(szLevelGet(0, buffer, -1), 0);
    EXPECT_STREQ(buffer, "Error");
    EXPECT_EQ(strLevelGet(0), "Information");
    EXPECT_EQ(strLevelGet(3) + strLevelGet(-1), "");
}

}  // namespace
