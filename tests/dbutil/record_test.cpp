#include "common/guards.h"
#include "dbutil.h"
#include "support/database.h"

using namespace quor::test;

namespace {

// The first row of a table, as a record that held other values before.
class Record : public DatabaseTest {
  protected:
    int convert(const std::string& schema, std::string table, bool trim) {
        run(schema);
        const quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path_.c_str()));
        quor::Result result;
        EXPECT_GE(QUORDBExecute(connection.get(), ("SELECT * FROM " + table).c_str(), quor::Adopt(result)), 0);
        return DBRecToLogInfo(table, result.get(), 0, &record_, trim);
    }

    // All texts.
    std::string texts() const {
        std::string all;
        for (const std::string* text : {&record_.tag, &record_.host, &record_.ip, &record_.fac, &record_.tzoffset,
                                        &record_.ldate, &record_.ltime, &record_.prog, &record_.msg, &record_.luser,
                                        &record_.event, &record_.xferip, &record_.fname, &record_.fsize}) {
            all += *text + ",";
        }
        return all;
    }

    _SYSLOG_LOG_DATA_tag record_{
        1, 2, 3, SYSLOG_PRIORITY_CRIT, "A", "B", "C", "D", "E", "F", "G", "H", "I", "J", "K", "L", "M", 4, "N"};
};

TEST_F(Record, OfTableLogsReadsEveryColumnByName) {
    ASSERT_EQ(
        convert("CREATE TABLE logs(prio, msg, id, host, ip, fac, tag, utcsec, tzoffset, ldate, ltime, prog);"
                "INSERT INTO logs VALUES('err', 'bob: hi: x', '18446744073709551615', 'h', '1.2.3.4', 'kern', 't',"
                "-3000000000, '+01:00', '2026-01-02', '03:04:05', 'p')",
                "logs", true),
        0);
    EXPECT_EQ(texts(), "t,h,1.2.3.4,kern,+01:00,2026-01-02,03:04:05,p, hi: x,J,K,L,M,N,");
    EXPECT_EQ(record_.id, 18446744073709551615U);
    EXPECT_EQ(record_.utcsec, -3000000000);
    EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_ERR);
    EXPECT_EQ(record_.xsec, 3);
    ASSERT_EQ(convert("DROP TABLE logs; CREATE TABLE logs(id, prio, msg); INSERT INTO logs VALUES(NULL, NULL, 'a:b')",
                      "logs", false),
              0);
    EXPECT_EQ(texts(), ",,,,,,,,a:b,J,K,L,M,N,") << "missing and null are empty";
    EXPECT_EQ(record_.id, 0U);
    EXPECT_EQ(record_.utcsec, 0);
    EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_DEBUG);
}

TEST_F(Record, OfTheOtherTablesHasTheirFieldsAlone) {
    const std::string log = "(id, host, llevel, prog, ldate, ltime, luser, msg)";
    const std::string row = " VALUES(9, 'h', 'alert', 'p', 'd', 't', 'u', 'x: y')";
    for (const std::string table : {"general_log", "connection_log"}) {
        ASSERT_EQ(convert("CREATE TABLE " + table + log + "; INSERT INTO " + table + row, table, true), 0);
        EXPECT_EQ(texts(), "A,h,C,D,E,d,t,p,I,u,x: y,L,M,N,") << "the message is the event, whole";
        EXPECT_EQ(record_.id, 9U);
        EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_ALERT);
    }
    ASSERT_EQ(convert("CREATE TABLE transfer_log(id, host, prog, ldate, ltime, luser, event, fname, isdir, fsize, ip);"
                      "INSERT INTO transfer_log VALUES(8, 'h', 'p', 'd', 't', 'u', 'e', 'f', 1, '2 KB', '::1')",
                      "transfer_log", false),
              0);
    EXPECT_EQ(texts(), "A,h,C,D,E,d,t,p,I,u,e,::1,f,2 KB,");
    EXPECT_EQ(record_.isdir, 1U);
    EXPECT_EQ(convert("CREATE TABLE LOGS(id); INSERT INTO LOGS VALUES(7)", "LOGS", false), -1) << "no other table";
    EXPECT_EQ(record_.id, 8U);
    EXPECT_EQ(DBRecToAllLogInfo(nullptr, 0, &record_, false), -1);
    EXPECT_EQ(DBRecToSysLogInfo(nullptr, 0, &record_), -1);
    EXPECT_EQ(DBRecToXferLogInfo(nullptr, 0, &record_), -1);
}

TEST(Names, MapBothWaysAndRefuseTheRest) {
    for (int32_t value = 0; value < SYSLOG_ATTRI_XFERIP; ++value) {
        const auto attr = static_cast<_SYSLOG_DB_ATTRI_tag>(value);
        const auto priority = static_cast<_SYSLOG_DB_PRIORITY_tag>(value % 8);
        EXPECT_EQ(LogAttriType(LogAttriStrGet(attr)), attr);
        EXPECT_EQ(PriorStrToType(PriorTypeToStr(priority).c_str()), priority);
    }
    EXPECT_STREQ(LogAttriStrGet(SYSLOG_ATTRI_XFERIP), "ip");
    EXPECT_EQ(LogAttriType("IP"), SYSLOG_ATTRI_NONE);
    for (const char* unknown : {static_cast<const char*>(nullptr), "", "warn", "ERR"}) {
        EXPECT_EQ(PriorStrToType(unknown), SYSLOG_PRIORITY_DEBUG);
    }
    EXPECT_EQ(PriorTypeToStr(static_cast<_SYSLOG_DB_PRIORITY_tag>(-1)) + LogAttriStrGet(SYSLOG_ATTRI_NONE), "");
    EXPECT_EQ(TrimUserName("a:b:c") + TrimUserName("none") + TrimUserName("a:"), "b:cnone");
}

}  // namespace
