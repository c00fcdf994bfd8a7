#include <limits>

#include "dbutil.h"
#include "support/testing.h"

using namespace quor::test;
using Counts = std::map<std::string, unsigned long long>;

namespace {

class Statistics : public testing::Test {
  protected:
    void SetUp() override {
        SqliteFile(path).run("CREATE TABLE histogram (id INTEGER PRIMARY KEY, device TEXT, count INTEGER);"
                             "CREATE TABLE eps (id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);");
        TakeSystemLogTexts();
    }

    TempFolder folder;
    std::string path = folder.path("accounting.db");
    std::string missing = folder.path("missing.db");
    std::string relative = "accounting.db";
};

TEST_F(Statistics, AnswerNothingWithoutAReadableDatabase) {
    std::string damaged = folder.write("damaged.db", std::string(4096, 'x'));
    for (std::string* bad : {&missing, &damaged, &relative}) {
        EXPECT_EQ(SyslogDBHistTotalGet(*bad), 0U);
        EXPECT_EQ(SyslogDBHistGetSingle(*bad, "a"), 0U);
        EXPECT_EQ(SyslogDBHistGet(*bad, 0), Counts{});
        EXPECT_TRUE(SyslogDBEpsGet(*bad, 0, 9).empty());
    }
    EXPECT_EQ(TakeSystemLogTexts(),
              (Strings{"dbutil:1051 Invalid syslog db path!", "dbutil:1092 Invalid syslog db path!",
                       "dbutil:1134 Invalid syslog db path!", "dbutil:982 Invalid syslog db path!"}));
    EXPECT_EQ(SyslogDBVersionGet(relative), 1U);
    EXPECT_EQ(TakeSystemLogTexts(), Strings{"dbutil:853 Invalid syslog db path! [accounting.db]"});
    EXPECT_EQ(SyslogDBVersionGet(missing), 1U);
    EXPECT_EQ(SyslogDBVersionGet(path), 2U);
    SqliteFile(path).run("CREATE TABLE db_info (device TEXT)");
    EXPECT_EQ(SyslogDBVersionGet(path), 1U);
    EXPECT_EQ(TakeSystemLogTexts(), Strings{});
}

TEST_F(Statistics, HistogramTotalSingleAndTop) {
    EXPECT_EQ(SyslogDBHistTotalGet(path), 0U);
    SqliteFile(path).run(
        "INSERT INTO histogram (device, count) VALUES ('d', 7), ('c', 1), ('b', 9), ('a', 5), ('a', 3), (NULL, 'x')");
    EXPECT_EQ(SyslogDBHistTotalGet(path), 25U);
    EXPECT_EQ(SyslogDBHistGetSingle(path, "b"), 9U);
    EXPECT_EQ(SyslogDBHistGetSingle(path, "B"), 0U);
    EXPECT_EQ(SyslogDBHistGetSingle(path, "it's"), 0U);
    EXPECT_EQ(SyslogDBHistGet(path, 0), (Counts{{"", 0}, {"a", 5}, {"b", 9}, {"c", 1}, {"d", 7}}));
    // Text sorts above numbers.
    EXPECT_EQ(SyslogDBHistGet(path, 3), (Counts{{"", 0}, {"b", 9}, {"d", 7}}));
}

TEST_F(Statistics, SamplesOfATimeRange) {
    SqliteFile(path).run(
        "INSERT INTO eps (stamp, device, eps) VALUES (200, 'y', 3), (100, 'x', 2), (200, 'x', 4), (200, 'x', 8),"
        "(201, 'x', 1), (99, 'x', 1), (150, NULL, -1), (160, 'z', 99999999999)");
    const std::map<int32_t, SYSLOG_LOG_EPS> samples = SyslogDBEpsGet(path, 100, 200);
    ASSERT_EQ(samples.size(), 4U);
    const auto check = [&samples](int32_t stamp, unsigned long long eps,
                                  const std::map<std::string, int32_t>& devices) {
        const SYSLOG_LOG_EPS& sample = samples.at(stamp);
        EXPECT_EQ(std::tie(sample.stamp, sample.eps, sample.devices), std::tuple(stamp, eps, devices));
    };
    check(100, 2, {{"x", 2}});
    check(150, std::numeric_limits<unsigned long long>::max(), {{"", -1}});
    check(160, 2147483647, {{"z", 2147483647}});
    check(200, 15, {{"x", 4}, {"y", 3}});                // all rows add up; a device keeps its first count
    EXPECT_TRUE(SyslogDBEpsGet(path, -1, 200).empty());  // negative bounds read as huge ones
}

TEST_F(Statistics, NamesOfBothLayouts) {
    using Names = std::map<unsigned long long, std::string>;
    SqliteFile(path).run("CREATE TABLE logs (host TEXT, prog TEXT, tag TEXT, fac TEXT);"
                         "INSERT INTO logs VALUES ('b', 'p', 't', 'f'), ('a', 'p', NULL, 'f'), ('b', 'q', 't', 'f')");
    Names names{{9, "old"}};
    const auto get = [&](std::string& db, int type) {
        return SyslogDBExtkeyMapGet(db, static_cast<_SYSLOG_EXTKEY_TB_TYPE_tag>(type), names);
    };
    EXPECT_EQ(get(path, 4), -1);
    EXPECT_EQ(get(relative, 0), -1);
    EXPECT_EQ(names, (Names{{9, "old"}}));
    ASSERT_EQ(get(path, SYSLOG_EXTKEY_HOST), 0);
    EXPECT_EQ(names, (Names{{0, "b"}, {1, "a"}}));
    ASSERT_EQ(get(path, SYSLOG_EXTKEY_TAG), 0);
    EXPECT_EQ(names, (Names{{0, "t"}, {1, ""}}));
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path, SYSLOG_EXTKEY_PROG, "q"), 1U);

    SqliteFile(path).run("CREATE TABLE db_info (device TEXT); CREATE TABLE facs (fac_id INTEGER, fac_name TEXT);"
                         "INSERT INTO facs VALUES (5, 'kern'), (2, 'mail'), (5, 'again'), (NULL, NULL)");
    ASSERT_EQ(get(path, SYSLOG_EXTKEY_FAC), 0);
    EXPECT_EQ(names, (Names{{0, ""}, {2, "mail"}, {5, "kern"}}));
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path, SYSLOG_EXTKEY_FAC, "mail"), 2U);
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path, SYSLOG_EXTKEY_FAC, "Mail"), 0U);
    TakeSystemLogTexts();
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path, SYSLOG_EXTKEY_HOST, "b"), 0U);  // there is no table hosts
    EXPECT_EQ(TakeSystemLogTexts(), Strings{"dbutil:956 Fail to get foreign key map"});
}

TEST_F(Statistics, ValuesOfOneAttribute) {
    SqliteFile(path).run(
        "CREATE TABLE logs (ip TEXT, prog TEXT); INSERT INTO logs VALUES ('2', 'p'), ('1', NULL), ('2', 'p')");
    std::list<std::string> values{"kept"};
    std::string ip = "ip";
    std::string prog = "prog";
    std::string capital = "Ip";
    _SYSLOG_SQL_LIMIT_tag second{1, 1};
    EXPECT_EQ(SyslogDBAttriValueGet(path, ip, nullptr, values), 0);
    EXPECT_EQ(SyslogDBAttriValueGet(path, prog, &second, values), 0);
    EXPECT_EQ(values, (std::list<std::string>{"kept", "1", "2", "p"}));
    EXPECT_EQ(SyslogDBAttriValueGet(path, capital, nullptr, values), -1);
    EXPECT_EQ(SyslogDBAttriValueGet(relative, ip, nullptr, values), -1);
    EXPECT_EQ(SyslogDBAttriValueGet(missing, ip, nullptr, values), -1);
    EXPECT_EQ(TakeSystemLogTexts(),
              (Strings{"dbutil:702 Log attribute type is incorrect!", "dbutil:697 Invalid syslog db path!"}));
}

}  // namespace
