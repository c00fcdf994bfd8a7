#include "common/guards.h"
#include "dbutil.h"
#include "support/testing.h"

using namespace quor::test;

namespace {

// The first row of a table, as a record that held other values before.
class Record : public testing::Test {
  protected:
    int convert(const std::string& schema, std::string table, bool trim = false) {
        SqliteFile(path_).run(schema);
        const quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path_.c_str()));
        quor::Result result;
        EXPECT_GE(QUORDBExecute(connection.get(), ("SELECT * FROM " + table).c_str(), quor::Adopt(result)), 0);
        return DBRecToLogInfo(table, result.get(), 0, &record_, trim);
    }

    const TempFolder folder_;
    const std::string path_ = folder_.path("log.db");
    _SYSLOG_LOG_DATA_tag record_{1,       2,       3,       SYSLOG_PRIORITY_CRIT,
                                 "tag",   "host",  "ip",    "fac",
                                 "tz",    "date",  "time",  "prog",
                                 "msg",   "luser", "event", "xferip",
                                 "fname", 4,       "fsize"};
};

TEST_F(Record, OfTableLogsReadsEveryColumnByName) {
    ASSERT_EQ(
        convert("CREATE TABLE logs(prio, msg, id, host, ip, fac, tag, utcsec, tzoffset, ldate, ltime, prog);"
                "INSERT INTO logs VALUES('err', 'bob: hi: x', '18446744073709551615', 'h', '1.2.3.4', 'kern', 't',"
                "-3000000000, '+01:00', '2026-01-02', '03:04:05', 'p')",
                "logs", true),
        0);
    EXPECT_EQ(record_.id, 18446744073709551615U);
    EXPECT_EQ(record_.utcsec, -3000000000);
    EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_ERR);
    EXPECT_EQ(record_.msg, " hi: x");
    EXPECT_EQ(record_.host + record_.ip + record_.fac + record_.tag, "h1.2.3.4kernt");
    EXPECT_EQ(record_.tzoffset + record_.ldate + record_.ltime + record_.prog, "+01:002026-01-0203:04:05p");
    EXPECT_EQ(record_.xsec, 3);
    EXPECT_EQ(record_.luser + record_.event + record_.fsize, "lusereventfsize");
    ASSERT_EQ(convert("DROP TABLE logs; CREATE TABLE logs(id, prio, msg); INSERT INTO logs VALUES(NULL, NULL, 'a:b')",
                      "logs"),
              0);
    EXPECT_EQ(record_.id, 0U) << "missing and null are empty";
    EXPECT_EQ(record_.utcsec, 0);
    EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_DEBUG);
    EXPECT_EQ(record_.host + record_.msg, "a:b");
}

TEST_F(Record, OfTheSystemLogsPutsTheMessageIntoTheEvent) {
    for (const char* table : {"general_log", "connection_log"}) {
        ASSERT_EQ(convert(std::string("CREATE TABLE ") + table + "(id, host, llevel, prog, ldate, ltime, luser, msg);" +
                              "INSERT INTO " + table + " VALUES(9, 'h', 'alert', 'p', 'd', 't', 'u', 'x: y')",
                          table, true),
                  0);
        EXPECT_EQ(record_.id, 9U);
        EXPECT_EQ(record_.prio, SYSLOG_PRIORITY_ALERT);
        EXPECT_EQ(record_.host + record_.prog + record_.ldate + record_.ltime + record_.luser, "hpdtu");
        EXPECT_EQ(record_.event + record_.msg, "x: ymsg");
    }
}

TEST_F(Record, OfTransfersReadsTheAddressIntoItsOwnField) {
    ASSERT_EQ(convert("CREATE TABLE transfer_log(id, host, prog, ldate, ltime, luser, event, fname, isdir, fsize, ip);"
                      "INSERT INTO transfer_log VALUES(9, 'h', 'p', 'd', 't', 'u', 'e', 'f', 1, '2 KB', '::1')",
                      "transfer_log"),
              0);
    EXPECT_EQ(record_.host + record_.prog + record_.ldate + record_.ltime + record_.luser, "hpdtu");
    EXPECT_EQ(record_.event + record_.fname + record_.fsize + record_.xferip, "ef2 KB::1");
    EXPECT_EQ(record_.isdir, 1U);
    EXPECT_EQ(record_.ip, "ip");
}

TEST_F(Record, RefusesOtherTablesAndNullHandles) {
    EXPECT_EQ(convert("CREATE TABLE LOGS(id); INSERT INTO LOGS VALUES(7)", "LOGS"), -1);
    EXPECT_EQ(record_.id, 1U);
    EXPECT_EQ(DBRecToAllLogInfo(nullptr, 0, &record_, false), -1);
    EXPECT_EQ(DBRecToSysLogInfo(nullptr, 0, &record_), -1);
    EXPECT_EQ(DBRecToXferLogInfo(nullptr, 0, &record_), -1);
}

TEST(Names, MapBothWaysAndRefuseTheRest) {
    for (int32_t value = 0; value < SYSLOG_ATTRI_XFERIP; ++value) {
        const auto attr = static_cast<_SYSLOG_DB_ATTRI_tag>(value);
        EXPECT_EQ(LogAttriType(LogAttriStrGet(attr)), attr);
    }
    EXPECT_STREQ(LogAttriStrGet(SYSLOG_ATTRI_XFERIP), "ip");
    EXPECT_EQ(LogAttriType("ip"), SYSLOG_ATTRI_IP);
    EXPECT_EQ(LogAttriType("IP"), SYSLOG_ATTRI_NONE);
    EXPECT_STREQ(LogAttriStrGet(SYSLOG_ATTRI_NONE), "");
    for (int32_t value = 0; value < 8; ++value) {
        const auto priority = static_cast<_SYSLOG_DB_PRIORITY_tag>(value);
        EXPECT_EQ(PriorStrToType(PriorTypeToStr(priority).c_str()), priority);
    }
    for (const char* unknown : {static_cast<const char*>(nullptr), "", "warn", "ERR"}) {
        EXPECT_EQ(PriorStrToType(unknown), SYSLOG_PRIORITY_DEBUG);
    }
    EXPECT_EQ(PriorTypeToStr(static_cast<_SYSLOG_DB_PRIORITY_tag>(-1)), "");
    EXPECT_EQ(TrimUserName("a:b:c"), "b:c");
    EXPECT_EQ(TrimUserName("none") + TrimUserName("a:"), "none");
}

}  // namespace
