#include "accounting.h"

#include <algorithm>
#include <random>

#include "support/clock.h"
#include "support/notices.h"
#include "support/testing.h"

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

// The counters kept in the plainest way: a walk of the histogram for every log.
struct Model {
    Histogram histogram;
    std::map<std::string, int> open;
    unsigned long long eps = 0;
    int64_t stamp = 0;
    Strings rows;

    void update(int64_t now) {
        if (now != stamp && eps != 0) {
            stamp = now;
            for (const auto& [name, count] : open) {
                rows.insert(rows.end(), {std::to_string(now), name, std::to_string(count)});
            }
            open.clear();
            eps = 0;
        }
    }

    void log(int64_t now, const std::string& device) {
        update(now);
        ++open[device];
        ++eps;
        const auto row = std::find_if(histogram.begin(), histogram.end(),
                                      [&device](const auto& known) { return known.first == device; });
        if (row == histogram.end()) {
            histogram.emplace_back(device, 1);
        } else {
            ++row->second;
        }
    }
};

}  // namespace

TEST_F(Accounting, CountsAsAWalkOfTheHistogramWould) {
    create("INSERT INTO histogram VALUES (NULL, 'd7', 40), (NULL, 'D7', 2)");
    std::mt19937 random(3);
    auto accounting = std::make_unique<AccountingManager>();
    Model model;
    model.histogram = {{"D7", 2}, {"d7", 40}};
    int64_t now = 1000;
    for (unsigned long long i = 1; i <= 3000; ++i) {
        now += random() % 10 == 0 ? static_cast<int64_t>(random() % 3) - 1 : 0;  // the clock may go back
        SetClock(now);
        std::string device = (random() % 4 == 0 ? "D" : "d") + std::to_string(random() % 12);
        device += random() % 6 == 0 ? std::string(random() % 2, '\0') + "'" : "";
        model.log(now, device);
        accounting->LogInc(device);
        if (random() % 20 == 0) {
            SetClock(++now);
            model.update(now);
            accounting->CurEpsUpdate();
        }
        ASSERT_EQ(accounting->CurrentEpsGet(), model.eps);
        ASSERT_EQ(accounting->TotalCountGet(), i);
    }
    EXPECT_EQ(histogramOf(*accounting), model.histogram);
    accounting = nullptr;  // writes
    // A statement ends a text at its zero byte.
    std::map<std::string, unsigned long long> stored;
    for (const auto& [device, count] : model.histogram) {
        stored[device.c_str()] = count;
    }
    for (std::string& field : model.rows) {
        field.resize(strlen(field.c_str()));
    }
    EXPECT_EQ(rows(), model.rows);
    AccountingManager next;
    EXPECT_EQ(histogramOf(next), Histogram(stored.begin(), stored.end()));
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
    WriteFile(paths::kNotifyRules,
              "[rate]\nnotify_type=\"1\"\nnotify_pri=\"0\"\nnotify_eps=\"3\"\nnotify_pat=\"\"\nnotify_enable=\"1\"\n");
    AccountingManager accounting;
    sample(accounting, 1000, {"a"});
    sample(accounting, 1001, {"a", "b"});
    EXPECT_TRUE(FakeNotices().sent.empty());
    TakeSystemLogTexts();
    for (const size_t sent : {1, 2}) {
        sample(accounting, 1001 + static_cast<int64_t>(sent), {"a", "b", "a"});
        ASSERT_EQ(FakeNotices().sent.size(), sent);
        EXPECT_EQ(FakeNotices().sent[sent - 1].tag, "QUORSYSLOG_EPS_EXCEED");
        EXPECT_EQ(FakeNotices().sent[sent - 1].values["%EPS%"], "3");
        FakeNotices().fail = true;
    }
    EXPECT_EQ(TakeSystemLogTexts().back(), "Fail to send syslog notification");
    EXPECT_EQ(SqliteFile(paths::kEventDb).query("SELECT count(*), event FROM log"),
              (Strings{"2", "Event detection: EPS is larger than [3]."}));
}

TEST_F(Accounting, AFailedSampleKeepsTheOnesBeforeItAFailedHistogramNone) {
    const std::tuple<const char*, const char*, const char*, Strings> cases[] = {
        {"CREATE TRIGGER t BEFORE INSERT ON eps WHEN NEW.device = 'b' BEGIN SELECT RAISE(ABORT, 'no'); END",
         "DROP TRIGGER t",
         "INSERT INTO eps VALUES(NULL, '1002', 'b', '1');",
         {"1001", "a", "1"}},
        {"ALTER TABLE histogram RENAME TO aside",
         "ALTER TABLE aside RENAME TO histogram",
         "INSERT OR REPLACE INTO histogram VALUES(NULL, 'a', 1);",
         {}},
    };
    for (const auto& [damage, repair, statement, kept] : cases) {
        SetUp();
        create(damage);
        AccountingManager accounting;
        sample(accounting, 1000, {"a"});
        sample(accounting, 1001, {"b"});
        TakeSystemLogTexts();
        EXPECT_EQ(accounting.AccoutingFlush2DB(), -1);
        const Strings messages = TakeSystemLogTexts();
        EXPECT_EQ(messages.rbegin()[kept.empty() ? 1 : 0], std::string("Fail to execute SQL command: ") + statement);
        EXPECT_EQ(rows(), kept);
        SqliteFile(kDb).run(repair);
        EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
        Strings all = kept;
        all.insert(all.end(), {"1001", "a", "1", "1002", "b", "1"});
        EXPECT_EQ(rows(), all);
    }
}

TEST_F(Accounting, OldSamplesGoOnceTheFileIsLarge) {
    create("INSERT INTO eps VALUES (NULL, 1000, 'old', 1), (NULL, strftime('%s', 'now') - 3600, 'recent', 1);"
           "CREATE TABLE filler (data BLOB); INSERT INTO filler VALUES (zeroblob(5200000))");
    AccountingManager accounting;
    // The new samples carry stamps of the test's clock.
    for (const auto& [size, left] : {std::pair(5242880, Strings{"new", "old", "recent"}), {5242881, {"recent"}}}) {
        std::filesystem::resize_file(kDb, static_cast<uintmax_t>(size));
        sample(accounting, 1000 + size % 2, {"new"});
        ASSERT_EQ(accounting.AccoutingFlush2DB(), 0);
        EXPECT_EQ(SqliteFile(kDb).query("SELECT DISTINCT device FROM eps ORDER BY device"), left);
    }
}

TEST_F(Accounting, FailsWhereTheDatabaseIsNoFile) {
    AccountingManager accounting;
    std::filesystem::create_directories(kDb);
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0) << "nothing to write";
    sample(accounting, 1000, {"a"});
    EXPECT_EQ(accounting.AccoutingFlush2DB(), -1);
    std::filesystem::remove(kDb);
    EXPECT_EQ(accounting.AccoutingFlush2DB(), 0);
    EXPECT_EQ(rows(), (Strings{"1001", "a", "1"}));
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
