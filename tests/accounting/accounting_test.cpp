#include "accounting.h"

#include "tests/support/clock.h"
#include "tests/support/db_spy.h"
#include "tests/support/notices.h"
#include "tests/support/testing.h"

using namespace quor::test;

namespace {

using Histogram = std::vector<std::pair<std::string, unsigned long long>>;
namespace paths = quor::paths;

const std::string kDb = paths::kAccountingDb;

class Accounting : public testing::Test {
  protected:
    void SetUp() override {
        std::filesystem::remove_all(std::filesystem::path(kDb).parent_path());
        std::filesystem::create_directories(std::filesystem::path(kDb).parent_path());
        std::filesystem::remove(paths::kEventDb);
        WriteFile(paths::kNotifyRules, "");
        FakeNotices() = {};
        SpyOnDb() = {};
        SetClock(1000);
    }

    // The package's database, and more.
    static void create(const std::string& sql) {
        SqliteFile(kDb).run(ReadFile(paths::kAccountingSchema));
        SqliteFile(kDb).run(sql);
    }

    // Closes one sample of one log for each device, at `now` + 1. Whole only when the last one was closed at `now`, or
    // with a single log: the second log of another second closes a sample itself.
    static void sample(AccountingManager& accounting, int64_t now, const Strings& devices) {
        SetClock(now);
        for (const std::string& device : devices) {
            accounting.LogInc(device);
        }
        SetClock(now + 1);
        accounting.CurEpsUpdate();
    }

    static Strings rows() { return SqliteFile(kDb).query("SELECT stamp, device, eps FROM eps ORDER BY id"); }
};

Histogram histogramOf(AccountingManager& accounting) {
    Histogram rows;
    for (const QUORLOG_LOG_DEVICE_STATISTIC& row : accounting.HistogramGet()) {
        rows.emplace_back(row.device, row.count);
    }
    return rows;
}

}  // namespace

TEST_F(Accounting, ASampleIsClosedByTheFirstLogOfAnotherSecond) {
    create("INSERT INTO histogram VALUES (NULL, 'd', 40), (NULL, 'D', 2)");
    auto accounting = std::make_unique<AccountingManager>();
    const std::string zero("d\0'", 3);
    // The clock, the device and how many logs the sample holds then. The clock may go back.
    const std::tuple<int64_t, std::string, unsigned long long> logs[] = {
        {1000, "d", 1}, {1000, "n", 1}, {1000, "d", 2}, {999, "d", 1}, {999, zero, 2}, {1001, "D", 1}};
    for (const auto& [now, device, open] : logs) {
        SetClock(now);
        accounting->LogInc(device);
        EXPECT_EQ(accounting->CurrentEpsGet(), open);
    }
    EXPECT_EQ(accounting->TotalCountGet(), 6U) << "of this process";
    EXPECT_EQ(histogramOf(*accounting), (Histogram{{"D", 3}, {"d", 43}, {"n", 1}, {zero, 1}}));
    accounting = nullptr;  // writes; a statement ends a text at its zero byte
    EXPECT_EQ(rows(),
              (Strings{"1000", "d", "1", "999", "d", "1", "999", "n", "1", "1001", "d", "1", "1001", "d", "1"}));
    AccountingManager next;
    EXPECT_EQ(next.ConfigLoad(), 0);
    EXPECT_EQ(histogramOf(next), (Histogram{{"D", 3}, {"d", 1}, {"n", 1}}));
}

TEST_F(Accounting, AFlushIsDueMoreThanFiveSecondsAfterTheLastQuestion) {
    AccountingManager accounting;
    const std::pair<int64_t, bool> questions[] = {{100, true},         {103, false},      {108, false},
                                                  {114, true},         {50, false},       {0x7ffffffd, true},
                                                  {0x80000001, false}, {0x80000007, true}};
    for (const auto& [now, due] : questions) {
        SetClock(now);
        EXPECT_EQ(accounting.isNeed2Flush(), due) << now;
    }
}

TEST_F(Accounting, ASampleAtTheThresholdIsNotifiedAndRecorded) {
    AccountingManager accounting;
    WriteFile(paths::kNotifyRules,
              "[rate]\nnotify_type=\"1\"\nnotify_pri=\"0\"\nnotify_eps=\"3\"\nnotify_pat=\"\"\nnotify_enable=\"1\"\n");
    accounting.RulesReload();
    sample(accounting, 1000, {"a"});
    sample(accounting, 1001, {"a", "b"});
    EXPECT_TRUE(FakeNotices().sent.empty());
    FakeNotices().fail = true;
    sample(accounting, 1002, {"a", "b", "a"});
    ASSERT_EQ(FakeNotices().sent.size(), 1U);
    EXPECT_EQ(FakeNotices().sent[0].values["%EPS%"], "3");
    const Strings log = TakeSystemLogTexts();  // ends with the creation of the database of events
    EXPECT_EQ(log.rbegin()[1], "Fail to send syslog notification");
    EXPECT_EQ(SqliteFile(paths::kEventDb).query("SELECT event FROM log"),
              Strings{"Event detection: EPS is larger than [3]."})
        << "recorded although it was not sent";
}

TEST_F(Accounting, AFailedSampleKeepsTheOnesBeforeItAFailedHistogramNone) {
    AccountingManager accounting;
    sample(accounting, 1000, {"a"});
    sample(accounting, 1001, {"b"});
    SpyOnDb().failing = "'b'";
    EXPECT_EQ(Said(accounting.AccoutingFlush2DB()),
              "-1 Fail to execute SQL command: INSERT INTO eps VALUES(NULL, '1002', 'b', '1');");
    EXPECT_EQ(rows(), (Strings{"1001", "a", "1"}));
    SqliteFile(kDb).run("DELETE FROM eps");
    SpyOnDb().failing = "REPLACE";
    EXPECT_EQ(accounting.AccoutingFlush2DB(), -1);
    const Strings log = TakeSystemLogTexts();
    EXPECT_EQ(log.at(1), "Fail to execute SQL command: INSERT OR REPLACE INTO histogram VALUES(NULL, 'a', 1);");
    EXPECT_EQ(log.back(), "Fail to check sanity (DBTranEnd)") << "rolled back";
    EXPECT_EQ(rows(), Strings());
    SpyOnDb() = {};
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
    EXPECT_EQ(rows(), (Strings{"1001", "a", "1", "1002", "b", "1"})) << "all that was kept in memory";
    SpyOnDb() = {};
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
    EXPECT_EQ(SpyOnDb().statements, Strings()) << "there is nothing to write";
}

TEST_F(Accounting, OldSamplesGoOnceTheFileIsLarge) {
    create("INSERT INTO eps VALUES (NULL, 1000, 'old', 1), (NULL, strftime('%s', 'now') - 3600, 'recent', 1);"
           "CREATE TABLE filler (data BLOB); INSERT INTO filler VALUES (zeroblob(5200000))");
    AccountingManager accounting;
    const std::string purge = "DELETE FROM eps WHERE stamp < strftime('%s', 'now') - 24*60*60;";
    // The new samples carry stamps of the test's clock.
    for (const auto& [size, left] : {std::pair(5242880, Strings{"new", "old", "recent"}), {5242881, {"recent"}}}) {
        std::filesystem::resize_file(kDb, static_cast<uintmax_t>(size));
        sample(accounting, 1000 + size % 2, {"new"});
        ASSERT_EQ(accounting.AccoutingFlush2DB(), 0);
        EXPECT_EQ(SqliteFile(kDb).query("SELECT DISTINCT device FROM eps ORDER BY device"), left);
    }
    sample(accounting, 2000, {"new"});
    SpyOnDb().failing = purge;
    EXPECT_EQ(Said(accounting.AccoutingFlush2DB()), "0 Fail to execute SQL command: " + purge);
}

TEST_F(Accounting, TrimForgetsTheOldestSamples) {
    AccountingManager accounting;
    sample(accounting, 1000, {"a"});
    sample(accounting, 1001, {"a", "b"});
    sample(accounting, 1002, {"a", "b"});
    sample(accounting, 1003, {"c"});
    for (const auto& [most, forgotten] : {std::pair(5U, 1U), {5U, 0U}, {2U, 2U}}) {
        EXPECT_EQ(accounting.EpsListTrim(most), forgotten);
    }
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
    EXPECT_EQ(rows(), (Strings{"1004", "c", "1"}));
    EXPECT_EQ(SqliteFile(kDb).query("SELECT sum(count) FROM histogram"), Strings{"6"});
}
