#include "dbutil.h"

#include <limits>
#include <sstream>

#include "common/handles.h"
#include "tests/support/database.h"
#include "tests/support/db_spy.h"

using namespace quor::test;

namespace {

using Conditions = std::list<_SYSLOG_SQL_COND_tag>;

class Record : public DatabaseTest {
  protected:
    // What comes of reading the first row of a table into a record that held other values: the result, the numbers and
    // the texts.
    std::string read(const std::string& schema, std::string table, bool trim) {
        run(schema);
        const quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path_.c_str()));
        quor::Result result;
        EXPECT_GE(QUORDBExecute(connection.get(), ("SELECT * FROM " + table).c_str(), quor::Adopt(result)), 0);
        _SYSLOG_LOG_DATA_tag r{
            1, 2, 3, SYSLOG_PRIORITY_CRIT, "A", "B", "C", "D", "E", "F", "G", "H", "I", "J", "K", "L", "M", 4, "N"};
        std::ostringstream all;
        all << DBRecToLogInfo(table, result.get(), 0, &r, trim) << ": ";
        all << r.id << ' ' << r.utcsec << ' ' << r.xsec << ' ' << r.prio << ' ' << r.isdir;
        for (const std::string& text : {r.tag, r.host, r.ip, r.fac, r.tzoffset, r.ldate, r.ltime, r.prog, r.msg,
                                        r.luser, r.event, r.xferip, r.fname, r.fsize}) {
            all << ',' << text;
        }
        return all.str();
    }
};

TEST_F(Record, HasTheFieldsOfItsTableAlone) {
    EXPECT_EQ(
        read("CREATE TABLE logs(prio, msg, id, host, ip, fac, tag, utcsec, tzoffset, ldate, ltime, prog);"
             "INSERT INTO logs VALUES('err', 'bob: hi: x', '18446744073709551615', 'h', '1.2.3.4', 'kern', 't',"
             "-3000000000, '+01:00', '2026-01-02', '03:04:05', 'p')",
             "logs", true),
        "0: 18446744073709551615 -3000000000 3 3 4,t,h,1.2.3.4,kern,+01:00,2026-01-02,03:04:05,p, hi: x,J,K,L,M,N");
    EXPECT_EQ(read("DROP TABLE logs; CREATE TABLE logs(id, prio, msg); INSERT INTO logs VALUES(NULL, NULL, 'a:b')",
                   "logs", false),
              "0: 0 0 3 7 4,,,,,,,,,a:b,J,K,L,M,N")
        << "missing and null are empty";
    run("CREATE TABLE general_log(id, host, llevel, prog, ldate, ltime, luser, msg);"
        "INSERT INTO general_log VALUES(9, 'h', 'alert', 'p', 'd', 't', 'u', 'x: y');");
    for (const char* table : {"general_log", "connection_log"}) {
        EXPECT_EQ(read("CREATE TABLE IF NOT EXISTS connection_log AS SELECT * FROM general_log", table, true),
                  "0: 9 2 3 1 4,A,h,C,D,E,d,t,p,I,u,x: y,L,M,N")
            << "the message is the event, whole";
    }
    EXPECT_EQ(read("CREATE TABLE transfer_log(id, host, prog, ldate, ltime, luser, event, fname, isdir, fsize, ip);"
                   "INSERT INTO transfer_log VALUES(8, 'h', 'p', 'd', 't', 'u', 'e', 'f', 1, '2 KB', '::1')",
                   "transfer_log", false),
              "0: 8 2 3 2 1,A,h,C,D,E,d,t,p,I,u,e,::1,f,2 KB");
    EXPECT_EQ(read("CREATE TABLE other(id); INSERT INTO other VALUES(7)", "other", false),
              "-1: 1 2 3 2 4,A,B,C,D,E,F,G,H,I,J,K,L,M,N");
    _SYSLOG_LOG_DATA_tag none{};
    EXPECT_EQ(DBRecToAllLogInfo(nullptr, 0, &none, false), -1);
}

TEST(Names, ThatAreUnknownAreRefused) {
    for (const int unknown : {-1, 19}) {
        EXPECT_STREQ(LogAttriStrGet(static_cast<_SYSLOG_DB_ATTRI_tag>(unknown)), "");
        EXPECT_EQ(PriorTypeToStr(static_cast<_SYSLOG_DB_PRIORITY_tag>(unknown)), "");
    }
    EXPECT_EQ(LogAttriType("ip"), SYSLOG_ATTRI_IP) << "not the one of transfers";
    EXPECT_EQ(LogAttriType("IP"), SYSLOG_ATTRI_NONE);
    EXPECT_EQ(PriorStrToType("emerg"), SYSLOG_PRIORITY_EMERG);
    EXPECT_EQ(PriorStrToType("ERR"), SYSLOG_PRIORITY_DEBUG);
    EXPECT_EQ(PriorStrToType(nullptr), SYSLOG_PRIORITY_DEBUG);
    EXPECT_EQ(TrimUserName("a:b:c") + TrimUserName("none") + TrimUserName("a:"), "b:cnone");
}

// Collects ids until so many are left to take.
struct Walk {
    std::string ids;
    int left;

    static int take(_SYSLOG_LOG_DATA_tag& record, void* context) {
        auto& walk = *static_cast<Walk*>(context);
        walk.ids += std::to_string(record.id) + " ";
        return --walk.left == 0 ? 1 : 0;
    }
};

// Ids 1 to 10; odd ones are of host "odd".
class Select : public DatabaseTest {
  protected:
    using Limit = _SYSLOG_SQL_LIMIT_tag;
    using Order = _SYSLOG_SQL_ORDER_tag;

    Select() {
        run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg);"
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i+1 FROM n WHERE i < 10)"
            "INSERT INTO logs SELECT i, iif(i % 2, 'odd', 'even'), 'm' || i FROM n;"
            "CREATE TABLE other(id INTEGER PRIMARY KEY); INSERT INTO other VALUES(1)");
        SpyOnDb() = {};
    }

    // The result, the ids and the statement.
    std::string select(Conditions conds, Limit* limit, Order* order, std::string table = "logs", int most = 100) {
        Walk walk{"", most};
        const int result = SyslogDBSelectByTable(path_, table, conds, limit, order, Walk::take, &walk, false);
        return std::to_string(result) + ": " + walk.ids + SpyOnDb().statements.back();
    }
    std::string count(Conditions conds, Limit* limit, Order* order, std::string table = "logs") {
        const int result = SyslogDBSelectCountByTable(path_, table, conds, limit, order);
        return std::to_string(result) + ": " + SpyOnDb().statements.back();
    }

    Conditions none_;
    Conditions all_{{SYSLOG_ATTRI_MSG, 8, "**", {}}};
    Conditions odd_{{SYSLOG_ATTRI_HOST, 0, "odd", {}}};
    Order newest_{0, SYSLOG_ATTRI_ID};
};

TEST_F(Select, PagesUnfilteredTablesByIdWindowAndOthersThroughTheLimitedSelect) {
    Limit page{3, 2};
    Limit large{(1ULL << 32) + 2, (1ULL << 33) + 1};  // the limited select takes the low 32 bits
    const std::string maximum = "SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE ";
    EXPECT_EQ(select(none_, &page, &newest_),
              "0: 8 7 6 " + maximum + "( id > totalCount - 5 AND id <= totalCount - 2) ORDER BY id desc");
    EXPECT_EQ(select(all_, &large, &newest_), "0: " + maximum +
                                                  "(msg GLOB '**') AND ( id > totalCount - 12884901891 "
                                                  "AND id <= totalCount - 8589934593) ORDER BY id desc");
    EXPECT_EQ(select(odd_, &large, &newest_), "0: 7 5 SELECT * FROM logs WHERE (host = 'odd') ORDER BY id desc [2,1]");
    Limit everything{0, 4};
    Order byHost{7, SYSLOG_ATTRI_HOST};
    EXPECT_EQ(select(none_, &everything, &byHost), "0: 2 4 6 8 10 1 3 5 7 9 SELECT * FROM logs ORDER BY host asc");
    EXPECT_EQ(select(none_, nullptr, &newest_, "logs", 2), "0: 10 9 SELECT * FROM logs ORDER BY id desc");
    EXPECT_EQ(select(none_, nullptr, nullptr, "other"), "0: SELECT * FROM other") << "a row of an unknown table";
    EXPECT_EQ(Said(select(none_, nullptr, nullptr, "nowhere")),
              "-1: SELECT * FROM nowhere fail to execute database command (SELECT * FROM nowhere)");
    EXPECT_EQ(SyslogDBSelect(path_, none_, nullptr, nullptr, nullptr, nullptr, false), 0) << "a walk over rows alone";
    path_ += "x";
    EXPECT_EQ(Said(SyslogDBSelect(path_, none_, nullptr, nullptr, nullptr, nullptr, false)),
              "-1 fail to connect database (" + path_ + ")");
}

TEST_F(Select, DeletesWhatTheConditionsSay) {
    EXPECT_EQ(SyslogDBDelete(path_, odd_), 0);
    EXPECT_EQ(query("SELECT DISTINCT host FROM logs"), Strings{"even"});
    EXPECT_EQ(SyslogDBDelete(path_, none_), 0);
    EXPECT_EQ(SpyOnDb().statements, Strings({"DELETE FROM logs WHERE (host = 'odd')", "DELETE FROM logs"}));
}

TEST_F(Select, CountsByLargestIdUnlessFiltered) {
    run("DELETE FROM logs WHERE id IN (3, 4, 5)");
    EXPECT_EQ(count(none_, nullptr, nullptr), "10: SELECT max(rowid) FROM logs");
    EXPECT_EQ(count(all_, nullptr, nullptr), "10: SELECT max(rowid) FROM logs WHERE (msg GLOB '**')");
    EXPECT_EQ(count(odd_, nullptr, &newest_), "3: SELECT COUNT(*) FROM logs WHERE (host = 'odd') ORDER BY id desc");
    Limit beyond{1, 1};
    EXPECT_EQ(count(none_, &beyond, nullptr), "-1: SELECT max(rowid) FROM logs [1,1]") << "the only row was skipped";
    EXPECT_EQ(count(none_, nullptr, nullptr, "logs GROUP BY host").substr(0, 3), "-2:");
    run("UPDATE logs SET id = 7000000000 WHERE id = 10");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), -1589934592) << "not the low 32 bits";
}

_SYSLOG_SQL_COND_tag cond(_SYSLOG_DB_ATTRI_tag attr, int op, const std::string& value, Conditions orList = {}) {
    return {attr, op, value, std::move(orList)};
}

// What is added to a text that is there already.
std::string rendered(Conditions conditions) {
    std::string text = "x ";
    EXPECT_EQ(SqlCondListToStr(conditions, text), 0);
    return text.substr(2);
}

TEST(Condition, EscapesTheValueForItsOperator) {
    using Case = std::tuple<_SYSLOG_DB_ATTRI_tag, int, const char*, const char*>;
    for (const auto& [attr, op, value, text] : {
             Case{SYSLOG_ATTRI_HOST, 0, R"(a\%_*?[])", R"((host = 'a\%_*?[]'))"},
             Case{SYSLOG_ATTRI_MSG, 7, R"(50%_*?\')", R"((msg NOT LIKE '50\%\_%_\\''' escape '\'))"},
             Case{SYSLOG_ATTRI_MSG, 9, "[x]'?", "(msg NOT GLOB '[[]x[]]''?')"},
             Case{SYSLOG_ATTRI_UTCSEC, 6, "1_*", R"((utcsec LIKE 1\_%))"},
             Case{SYSLOG_ATTRI_ISDIR, 2, "1", "(isdir < '1')"},
             Case{SYSLOG_ATTRI_ID, 10, "1", "(id  1)"},
         }) {
        EXPECT_EQ(rendered({cond(attr, op, value)}), text);
    }
}

TEST(Condition, WhoseValueCannotBeEscapedHasAnEmptyOne) {
    for (const char* const failing : {"quotes", "backslashes"}) {
        SpyOnDb().failing = failing;
        EXPECT_EQ(rendered({cond(SYSLOG_ATTRI_HOST, SYSLOG_OP_LIKE, "value")}), "(host LIKE '' escape '\\')");
        EXPECT_EQ(SpyOnDb().escapes.back(), failing) << "another escape was asked for";
    }
    SpyOnDb() = {};
    EXPECT_EQ(CondValueEscape(nullptr), "");
}

TEST(Condition, ReplacesTheTextAndJoinsAlternativesOneLevelDeep) {
    const Conditions never{cond(SYSLOG_ATTRI_HOST, 0, "never")};
    std::string text = "replaced";
    EXPECT_EQ(SqlCondToStr(cond(SYSLOG_ATTRI_HOST, 0, "a", {cond(SYSLOG_ATTRI_MSG, 6, "c", never)}), text), 0);
    EXPECT_EQ(text, "((host = 'a') OR (msg LIKE 'c' escape '\\'))");
}

TEST(Search, TurnsAFormIntoConditions) {
    std::string hosts = "a, b";
    std::string any = "any";
    std::string day = "2014/01/02";
    Conditions conds;
    LogSearchCondListGen(hosts, any, any, any, any, day, day, conds);
    EXPECT_EQ(rendered(conds), "((host = 'a') OR (host = ' b')) AND (msg GLOB 'any') AND (ldate = '2014/01/02')");
    conds.clear();
    std::string unset = "0";
    std::string last = "2014/02/03";
    LogSearchCondListGen(any, any, any, any, unset, day, unset, conds);
    LogSearchCondListGen(any, unset, unset, unset, day, unset, last, conds);
    EXPECT_EQ(rendered(conds), "(msg GLOB '0') AND (ldate >= '2014/01/02') AND (llevel = '0') AND (fac = '0') AND "
                               "(prog = '0') AND (msg GLOB '2014/01/02') AND (ldate <= '2014/02/03')");
}

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

Conditions none;
Values allValues;
Names allNames;
std::string host = "host";

TEST_F(Statistics, AndSelectionsAnswerNothingWithoutAReadableDatabase) {
    run("CREATE TABLE logs (host); INSERT INTO logs VALUES ('a');"
        "INSERT INTO histogram VALUES (1, 'a', 1); INSERT INTO eps VALUES (1, 1, 'a', 1)");
    // The line in messages, what is answered and the question.
    const std::tuple<int, std::string, std::string (*)(std::string&)> cases[] = {
        {464, "-1",
         [](auto& db) { return std::to_string(SyslogDBSelect(db, none, nullptr, nullptr, nullptr, nullptr, false)); }},
        {573, "-1", [](auto& db) { return std::to_string(SyslogDBSelectCount(db, none, nullptr, nullptr)); }},
        {697, "-1", [](auto& db) { return std::to_string(SyslogDBAttriValueGet(db, host, nullptr, allValues)); }},
        {887, "-1", [](auto& db) { return std::to_string(SyslogDBExtkeyMapGet(db, SYSLOG_EXTKEY_HOST, allNames)); }},
        {982, "0", [](auto& db) { return std::to_string(SyslogDBEpsGet(db, 0, 9).size()); }},
        {1051, "0", [](auto& db) { return std::to_string(SyslogDBHistTotalGet(db)); }},
        {1092, "0", [](auto& db) { return std::to_string(SyslogDBHistGetSingle(db, "a")); }},
        {1134, "0", [](auto& db) { return std::to_string(SyslogDBHistGet(db, 0).size()); }},
        {653, "-1", [](auto& db) { return std::to_string(SyslogDBDelete(db, none)); }},
    };
    std::string relative = "log.db";
    std::string missing = folder_.path("none.db");
    for (const auto& [line, answer, question] : cases) {
        EXPECT_EQ(Said(question(relative)), answer + " dbutil:" + std::to_string(line) + " Invalid syslog db path!");
        EXPECT_EQ(question(missing), answer) << line;
        SpyOnDb().failing = "FROM";
        EXPECT_EQ(question(path_), answer) << line;
        SpyOnDb() = {};
        EXPECT_NE(question(path_), answer) << line;
        SpyOnDb().rowsLeft = 0;
        EXPECT_EQ(question(path_), line == 653 ? "0" : answer) << line;
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
    EXPECT_EQ(Said(std::to_string(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_HOST, "b"))),
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
