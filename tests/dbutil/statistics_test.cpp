#include <limits>

#include "dbutil.h"
#include "tests/support/database.h"

using namespace quor::test;

namespace {

class Statistics : public DatabaseTest {
  protected:
    Statistics() {
        run("CREATE TABLE histogram (id INTEGER PRIMARY KEY, device TEXT, count INTEGER);"
            "CREATE TABLE eps (id INTEGER PRIMARY KEY, stamp INTEGER, device TEXT, eps INTEGER);");
    }

    std::string relative_ = "accounting.db";
};

TEST_F(Statistics, AnswerNothingWithoutAReadableDatabase) {
    std::string host = "host";
    std::list<std::string> values;
    EXPECT_EQ(SyslogDBHistTotalGet(relative_), 0U);
    EXPECT_EQ(SyslogDBAttriValueGet(relative_, host, nullptr, values), -1);
    expectLog({"dbutil:1051 Invalid syslog db path!", "dbutil:697 Invalid syslog db path!"});
    std::string missing = folder_.path("missing.db");
    EXPECT_EQ(SyslogDBVersionGet(missing), 1U);
    EXPECT_EQ(SyslogDBVersionGet(path_), 2U);
    run("CREATE TABLE db_info (device TEXT)");
    EXPECT_EQ(SyslogDBVersionGet(path_), 1U);
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
    using Names = std::map<unsigned long long, std::string>;
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
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_PROG, "q"), 1U);

    run("CREATE TABLE db_info (device TEXT); CREATE TABLE facs (fac_id INTEGER, fac_name TEXT);"
        "INSERT INTO facs VALUES (4294967299, 'kern'), (2, 'mail'), (4294967299, 'again'), (NULL, NULL)");
    ASSERT_EQ(get(path_, SYSLOG_EXTKEY_FAC), 0);
    EXPECT_EQ(names, (Names{{0, ""}, {2, "mail"}, {4294967299, "kern"}}));
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_FAC, "kern"), 4294967299U);
    EXPECT_EQ(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_HOST, "b"), 0U);  // there is no table hosts
}

}  // namespace
