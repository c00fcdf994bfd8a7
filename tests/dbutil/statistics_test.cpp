#include <limits>

#include "dbutil.h"
#include "tests/support/database.h"
#include "tests/support/db_spy.h"

using namespace quor::test;

namespace {

class Statistics : public DatabaseTest {
  protected:
    Statistics() {
        run("CREATE TABLE histogram (id INTEGER PRIMARY KEY, device TEXT, count INTEGER);"
            "CREATE TABLE eps (id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);");
        SpyOnDb() = {};
    }
};

using Values = std::list<std::string>;
using Names = std::map<unsigned long long, std::string>;
using Counts = std::map<std::string, unsigned long long>;

std::list<_SYSLOG_SQL_COND_tag> none;
std::string host = "host";

long long valuesOf(std::string& db) {
    Values values;
    return SyslogDBAttriValueGet(db, host, nullptr, values);
}

long long namesOf(std::string& db) {
    Names names;
    return SyslogDBExtkeyMapGet(db, SYSLOG_EXTKEY_HOST, names);
}

TEST_F(Statistics, AndSelectionsAnswerNothingWithoutAReadableDatabase) {
    run("CREATE TABLE logs (host); INSERT INTO logs VALUES ('a');"
        "INSERT INTO histogram VALUES (1, 'a', 1); INSERT INTO eps VALUES (1, 1, 'a', 1)");
    // The line in messages, what is answered and the question.
    const std::tuple<int, long long, long long (*)(std::string&)> cases[] = {
        {464, -1,
         [](auto& db) -> long long { return SyslogDBSelect(db, none, nullptr, nullptr, nullptr, nullptr, false); }},
        {573, -1, [](auto& db) -> long long { return SyslogDBSelectCount(db, none, nullptr, nullptr); }},
        {697, -1, valuesOf},
        {887, -1, namesOf},
        {982, 0, [](auto& db) -> long long { return SyslogDBEpsGet(db, 0, 9).size(); }},
        {1051, 0, [](auto& db) -> long long { return SyslogDBHistTotalGet(db); }},
        {1092, 0, [](auto& db) -> long long { return SyslogDBHistGetSingle(db, "a"); }},
        {1134, 0, [](auto& db) -> long long { return SyslogDBHistGet(db, 0).size(); }},
        {653, -1, [](auto& db) -> long long { return SyslogDBDelete(db, none); }},
    };
    std::string relative = "log.db";
    std::string missing = folder_.path("none.db");
    for (const auto& [line, answer, question] : cases) {
        EXPECT_EQ(Said(question(relative)),
                  std::to_string(answer) + " dbutil:" + std::to_string(line) + " Invalid syslog db path!");
        EXPECT_EQ(question(missing), answer) << line;
        SpyOnDb().failing = "FROM";
        EXPECT_EQ(question(path_), answer) << line;
        SpyOnDb() = {};
        EXPECT_NE(question(path_), answer) << line;
        SpyOnDb().rowsLeft = 0;
        EXPECT_EQ(question(path_), line == 653 ? 0 : answer) << line;
        SpyOnDb() = {};
    }
    EXPECT_FALSE(std::filesystem::exists(missing));
}

TEST_F(Statistics, TellTheLayoutOfALogDatabase) {
    std::string relative = "log.db";
    std::string missing = folder_.path("none.db");
    EXPECT_EQ(Said(SyslogDBVersionGet(relative)), "1 dbutil:853 Invalid syslog db path! [log.db]");
    EXPECT_EQ(SyslogDBVersionGet(missing), 1U);
    EXPECT_EQ(SyslogDBVersionGet(path_), 2U);
    run("CREATE TABLE db_info (device TEXT)");
    EXPECT_EQ(SyslogDBVersionGet(path_), 1U);
}

TEST_F(Statistics, CountsByDevice) {
    run("INSERT INTO histogram VALUES (1, 'a', 5), (2, 'b', 9), (3, 'c', 1), (4, 'd', 7), (5, 'b', 8)");
    EXPECT_EQ(SyslogDBHistTotalGet(path_), 30U);
    EXPECT_EQ(SyslogDBHistGetSingle(path_, "d"), 7U);
    EXPECT_EQ(SyslogDBHistGet(path_, 3), (Counts{{"b", 9}, {"d", 7}}));
    EXPECT_EQ(SyslogDBHistGet(path_, 0), (Counts{{"a", 5}, {"b", 9}, {"c", 1}, {"d", 7}}));
}

TEST_F(Statistics, SamplesOfATimeRange) {
    run("INSERT INTO eps (stamp, device, eps) VALUES (200, 'y', 3), (100, 'x', 2), (200, 'x', 4), (200, 'x', 8),"
        "(201, 'x', 1), (99, 'x', 1), (150, NULL, -1), (160, 'z', 99999999999)");
    using Sample = std::tuple<int32_t, unsigned long long, std::map<std::string, int32_t>>;
    std::vector<Sample> samples;
    for (const auto& [stamp, sample] : SyslogDBEpsGet(path_, 100, 200)) {
        EXPECT_EQ(sample.stamp, stamp);
        samples.emplace_back(stamp, sample.eps, sample.devices);
    }
    // All rows of a stamp add up; a device keeps its first count.
    EXPECT_EQ(samples, (std::vector<Sample>{{100, 2, {{"x", 2}}},
                                            {150, std::numeric_limits<unsigned long long>::max(), {{"", -1}}},
                                            {160, 2147483647, {{"z", 2147483647}}},
                                            {200, 15, {{"x", 4}, {"y", 3}}}}));
    EXPECT_TRUE(SyslogDBEpsGet(path_, -1, 200).empty());  // negative bounds read as huge ones
}

TEST_F(Statistics, NamesOfBothLayouts) {
    run("CREATE TABLE logs (host TEXT, prog TEXT, tag TEXT, fac TEXT);"
        "INSERT INTO logs VALUES ('b', 'p', 't', 'f'), ('a', 'p', NULL, 'f'), ('b', 'q', 't', 'f')");
    Names names{{9, "old"}};
    const auto get = [&](std::string& db, int type) {
        return SyslogDBExtkeyMapGet(db, static_cast<_SYSLOG_EXTKEY_TB_TYPE_tag>(type), names);
    };
    EXPECT_EQ(get(path_, 4), -1);
    EXPECT_EQ(names, (Names{{9, "old"}}));
    ASSERT_EQ(get(path_, SYSLOG_EXTKEY_TAG), 0);
    EXPECT_EQ(names, (Names{{0, "t"}, {1, ""}}));
    ASSERT_EQ(get(path_, SYSLOG_EXTKEY_FAC), 0);
    EXPECT_EQ(names, (Names{{0, "f"}}));
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_PROG, "q"), 1U);
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_HOST, "a"), 1U);

    run("CREATE TABLE db_info (device TEXT); CREATE TABLE facs (fac_id INTEGER, fac_name TEXT);"
        "INSERT INTO facs VALUES (4294967299, 'kern'), (2, 'mail'), (4294967299, 'again'), (NULL, NULL)");
    ASSERT_EQ(get(path_, SYSLOG_EXTKEY_FAC), 0);
    EXPECT_EQ(names, (Names{{0, ""}, {2, "mail"}, {4294967299, "kern"}}));
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_FAC, "kern"), 4294967299U);
    EXPECT_EQ(Said(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_HOST, "b")),
              "0 dbutil:956 Fail to get foreign key map");
    EXPECT_EQ(std::exchange(SpyOnDb().statements, {}).back(), "SELECT * FROM hosts");
    for (const auto& [type, table] : {std::pair(SYSLOG_EXTKEY_PROG, "prog"), {SYSLOG_EXTKEY_TAG, "tag"}}) {
        run(std::string("CREATE TABLE ") + table + "s AS SELECT 7 " + table + "_id, 'x' " + table + "_name");
        EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, type, "x"), 7U);
    }
}

TEST_F(Statistics, ValuesOfAnAttributeInAscendingOrder) {
    run("CREATE TABLE logs (host); INSERT INTO logs VALUES ('c'), ('a'), (NULL), ('b'), ('a')");
    Values values{"old"};
    _SYSLOG_SQL_LIMIT_tag page{2, 1};
    EXPECT_EQ(SyslogDBAttriValueGet(path_, host, &page, values), 0);
    EXPECT_EQ(SyslogDBAttriValueGet(path_, host, nullptr, values), 0);
    EXPECT_EQ(values, (Values{"old", "a", "b", "", "a", "b", "c"}));
    std::string unknown = "Host";
    EXPECT_EQ(Said(SyslogDBAttriValueGet(path_, unknown, nullptr, values)),
              "-1 dbutil:702 Log attribute type is incorrect!");
}

}  // namespace
