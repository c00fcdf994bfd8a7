#include "dbutil.h"

#include <sstream>

#include "common/handles.h"
#include "tests/support/database.h"
#include "tests/support/db_spy.h"
#include "tests/support/faults.h"

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
}

TEST_F(Record, IsNotMadeOfNothing) {
    _SYSLOG_LOG_DATA_tag record;
    EXPECT_EQ(DBRecToAllLogInfo(nullptr, 0, &record, false), -1);
    EXPECT_EQ(DBRecToSysLogInfo(nullptr, 0, &record), -1);
    EXPECT_EQ(DBRecToXferLogInfo(nullptr, 0, &record), -1);
}

// The names of the values from -1 to `last`, each followed by a comma.
template <typename Value, typename NameOf>
std::string names(int last, NameOf nameOf) {
    std::string all;
    for (int value = -1; value <= last; ++value) {
        all += std::string(nameOf(static_cast<Value>(value))) + ",";
    }
    return all;
}

TEST(Names, ThatAreUnknownAreRefused) {
    EXPECT_EQ(
        names<_SYSLOG_DB_ATTRI_tag>(19, LogAttriStrGet),
        ",id,host,ip,fac,prio,llevel,tag,utcsec,tzoffset,ldate,ltime,prog,msg,luser,event,isdir,fname,fsize,ip,,");
    EXPECT_EQ(LogAttriType("ip"), SYSLOG_ATTRI_IP) << "not the one of transfers";
    EXPECT_EQ(LogAttriType("IP"), SYSLOG_ATTRI_NONE);
    EXPECT_EQ(names<_SYSLOG_DB_PRIORITY_tag>(8, PriorTypeToStr), ",emerg,alert,crit,err,warning,notice,info,debug,,");
    EXPECT_EQ(PriorStrToType("emerg"), SYSLOG_PRIORITY_EMERG);
    EXPECT_EQ(PriorStrToType("ERR"), SYSLOG_PRIORITY_DEBUG);
    EXPECT_EQ(PriorStrToType(nullptr), SYSLOG_PRIORITY_DEBUG);
    EXPECT_EQ(TrimUserName("a:b:c") + TrimUserName("none") + TrimUserName("a:"), "b:cnone");
}

// Collects ids, up to `most`.
struct Walk {
    Strings ids;
    size_t most = 1000;

    static int take(_SYSLOG_LOG_DATA_tag& record, void* context) {
        auto& walk = *static_cast<Walk*>(context);
        walk.ids.push_back(std::to_string(record.id));
        return walk.ids.size() >= walk.most ? 1 : 0;
    }
};

// Ids 1 to 10; odd ones are of host "odd".
class Select : public DatabaseTest {
  protected:
    Select() {
        run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, msg);"
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i+1 FROM n WHERE i < 10)"
            "INSERT INTO logs SELECT i, iif(i % 2, 'odd', 'even'), 'm' || i FROM n;"
            "CREATE TABLE other(id INTEGER PRIMARY KEY); INSERT INTO other VALUES(1)");
        SpyOnDb() = {};
    }

    // What happened to the statements that were sent since.
    static void expectStatements(const Strings& statements) {
        EXPECT_EQ(std::exchange(SpyOnDb().statements, {}), statements);
    }

    int select(Conditions conds, _SYSLOG_SQL_LIMIT_tag* limit, _SYSLOG_SQL_ORDER_tag* order) {
        return SyslogDBSelect(path_, conds, limit, order, Walk::take, &walk_, false);
    }

    Conditions none_;
    Conditions all_{{SYSLOG_ATTRI_MSG, 8, "**", {}}};
    Conditions odd_{{SYSLOG_ATTRI_HOST, 0, "odd", {}}};
    _SYSLOG_SQL_ORDER_tag newest_{0, SYSLOG_ATTRI_ID};
    Walk walk_;
};

TEST_F(Select, PagesUnfilteredTablesByIdWindowAndOthersThroughTheLimitedSelect) {
    _SYSLOG_SQL_LIMIT_tag page{3, 2};
    _SYSLOG_SQL_LIMIT_tag large{(1ULL << 32) + 2, (1ULL << 33) + 1};  // the limited select takes the low 32 bits
    ASSERT_EQ(select(none_, &page, &newest_), 0);
    EXPECT_EQ(walk_.ids, Strings({"8", "7", "6"}));
    ASSERT_EQ(select(all_, &large, &newest_), 0);
    ASSERT_EQ(select(odd_, &large, &newest_), 0);
    EXPECT_EQ(walk_.ids, Strings({"8", "7", "6", "7", "5"}));
    const std::string maximum = "SELECT *, (SELECT max(rowid) FROM logs) totalCount FROM logs WHERE ";
    expectStatements({maximum + "( id > totalCount - 5 AND id <= totalCount - 2) ORDER BY id desc",
                      maximum + "(msg GLOB '**') AND ( id > totalCount - 12884901891 AND id <= totalCount - "
                                "8589934593) ORDER BY id desc",
                      "SELECT * FROM logs WHERE (host = 'odd') ORDER BY id desc [2,1]"});
}

TEST_F(Select, WithoutAWindowGivesEveryRowThatIsTaken) {
    _SYSLOG_SQL_LIMIT_tag everything{0, 4};
    _SYSLOG_SQL_ORDER_tag oldest{7, SYSLOG_ATTRI_HOST};
    ASSERT_EQ(select(none_, &everything, &oldest), 0);
    ASSERT_EQ(select(none_, nullptr, nullptr), 0);
    EXPECT_EQ(walk_.ids.size(), 20U);
    expectStatements({"SELECT * FROM logs ORDER BY host asc", "SELECT * FROM logs"});
    std::string other = "other";
    EXPECT_EQ(SyslogDBSelectByTable(path_, other, none_, nullptr, nullptr, Walk::take, &walk_, false), 0);
    EXPECT_EQ(walk_.ids.size(), 20U) << "a row of an unknown table was handed over";
    walk_.most = 21;
    EXPECT_EQ(select(none_, nullptr, &newest_), 0);
    EXPECT_EQ(walk_.ids.back(), "10") << "the walk ends when it is asked to";
}

TEST_F(Select, ReportsWhatFailed) {
    std::string missing = folder_.path("none.db");
    std::string table = "nowhere";
    EXPECT_EQ(Said(SyslogDBSelect(missing, none_, nullptr, nullptr, nullptr, nullptr, false)),
              "-1 fail to connect database (" + missing + ")");
    EXPECT_EQ(Said(SyslogDBSelectByTable(path_, table, none_, nullptr, nullptr, nullptr, nullptr, false)),
              "-1 fail to execute database command (SELECT * FROM nowhere)");
}

TEST_F(Select, DeletesWhatTheConditionsSay) {
    EXPECT_EQ(SyslogDBDelete(path_, odd_), 0);
    EXPECT_EQ(query("SELECT DISTINCT host FROM logs"), Strings{"even"});
    EXPECT_EQ(SyslogDBDelete(path_, none_), 0);
    expectStatements({"DELETE FROM logs WHERE (host = 'odd')", "DELETE FROM logs"});
}

TEST_F(Select, CountsByLargestIdUnlessFiltered) {
    run("DELETE FROM logs WHERE id IN (3, 4, 5)");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, all_, nullptr, nullptr), 10);
    EXPECT_EQ(SyslogDBSelectCount(path_, odd_, nullptr, &newest_), 3);
    expectStatements({"SELECT max(rowid) FROM logs", "SELECT max(rowid) FROM logs WHERE (msg GLOB '**')",
                      "SELECT COUNT(*) FROM logs WHERE (host = 'odd') ORDER BY id desc"});

    _SYSLOG_SQL_LIMIT_tag beyond{1, 1};
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, &beyond, nullptr), -1) << "the only row was skipped";
    run("UPDATE logs SET id = 7000000000 WHERE id = 10");
    EXPECT_EQ(SyslogDBSelectCount(path_, none_, nullptr, nullptr), -1589934592) << "not the low 32 bits";

    std::string twoRows = "logs GROUP BY host";
    EXPECT_EQ(SyslogDBSelectCountByTable(path_, twoRows, none_, nullptr, nullptr), -2);
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
         }) {
        EXPECT_EQ(rendered({cond(attr, op, value)}), text);
    }
}

TEST(Condition, WhoseValueCannotBeEscapedHasAnEmptyOne) {
    const std::string value = "it's " + std::string(100, '*');
    const _SYSLOG_SQL_COND_tag like = cond(SYSLOG_ATTRI_HOST, SYSLOG_OP_LIKE, value);
    for (const char* const failing : {"quotes", "backslashes"}) {
        SpyOnDb().failing = failing;
        EXPECT_EQ(rendered({like}), "(host LIKE '' escape '\\')");
        EXPECT_EQ(SpyOnDb().escapes.back(), failing) << "another escape was asked for";
    }
    SpyOnDb() = {};
    for (const int op : {SYSLOG_OP_EQUAL, SYSLOG_OP_NOT_LIKE, SYSLOG_OP_NOT_GLOB}) {
        const _SYSLOG_SQL_COND_tag any = cond(SYSLOG_ATTRI_HOST, op, value);
        for (int nth = 1; nth == 1 || Fault::struck(); ++nth) {
            const Fault fault(Resource::Memory, nth, false);
            const std::string text = CondValueEscape(&any);
            EXPECT_EQ(text.empty(), Fault::struck()) << "operator " << op << ", allocation " << nth;
        }
    }
    EXPECT_EQ(CondValueEscape(nullptr), "");
}

TEST(Condition, ReplacesTheTextAndJoinsAlternativesOneLevelDeep) {
    const Conditions never{cond(SYSLOG_ATTRI_HOST, 0, "never")};
    std::string text = "replaced";
    EXPECT_EQ(SqlCondToStr(cond(SYSLOG_ATTRI_HOST, 0, "a", {cond(SYSLOG_ATTRI_MSG, 6, "c", never)}), text), 0);
    EXPECT_EQ(text, "((host = 'a') OR (msg LIKE 'c' escape '\\'))");
    const auto comparison = [](int op) { return rendered({cond(SYSLOG_ATTRI_ID, op, "1")}); };
    EXPECT_EQ(names<int>(10, comparison),
              "(id  1),(id = 1),(id != 1),(id < 1),(id <= 1),(id > 1),(id >= 1),(id LIKE 1),"
              "(id NOT LIKE 1),(id GLOB 1),(id NOT GLOB 1),(id  1),");
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
    LogSearchCondListGen(any, any, any, any, unset, day, unset, conds);
    LogSearchCondListGen(any, unset, unset, unset, day, unset, hosts, conds);
    EXPECT_EQ(rendered(conds), "(msg GLOB '0') AND (ldate >= '2014/01/02') AND (llevel = '0') AND (fac = '0') AND "
                               "(prog = '0') AND (msg GLOB '2014/01/02') AND (ldate <= 'a, b')");
}

}  // namespace
