#include "parser.h"

#include <gtest/gtest.h>

#include "tests/support/system_log.h"

namespace {

using namespace quor::test;
using Texts = std::vector<std::string>;

const std::string kFields = "local0 err 2026-11-21 05:15:54 1795238154 17 +00:00 router1 10.0.0.1 kernel";
const std::string kEntry = kFields + " 84 link  is down ";

}  // namespace

TEST(ParseSingleEntry, SplitsAtBlanksAloneAndKeepsTheMessageAsItIs) {
    LogParser parser;
    _SYSLOG_LOG_DATA_tag log;
    const std::string entry = " fac  err date time 99999999999999999999 -x +00:00 a\tb 10.0.0.1 prog tag  two  blanks ";
    ASSERT_EQ(parser.ParseSingleEntry(entry, log), 0);
    EXPECT_EQ(log.fac + "," + log.ldate + "," + log.ltime + "," + log.tzoffset + "," + log.host + "," + log.ip + "," +
                  log.prog + "," + log.tag + "," + log.msg,
              "fac,date,time,+00:00,a\tb,10.0.0.1,prog,tag, two  blanks ");
    EXPECT_EQ(log.prio, SYSLOG_PRIORITY_ERR);
    EXPECT_EQ(log.utcsec, INT64_MAX);
    EXPECT_EQ(log.xsec, 0);
    EXPECT_EQ(parser.ParseSingleEntry("new crit", log), -1);
    EXPECT_EQ(log.fac + log.ldate, "newdate") << "the fields that were found keep their new values";
    EXPECT_EQ(log.prio, SYSLOG_PRIORITY_CRIT);
}

TEST(LogParser, TokenizeDropsEmptyPieces) {
    using Pieces = std::list<std::string>;
    EXPECT_EQ(LogParser().Tokenize(",;a;,b,c", ",;"), (Pieces{"a", "b", "c"}));
    EXPECT_EQ(LogParser().Tokenize("whole", ""), Pieces{"whole"});
}

TEST(LogParser, KeepsTheLinesThatParse) {
    LogParser parser;
    std::string chunk = "\n" + kEntry + "\n\ntoo short\n" + kEntry + "\n" + kFields + " last";
    TakeSystemLog();
    EXPECT_EQ(parser.LogAdd(chunk), 0);
    EXPECT_EQ(TakeSystemLogTexts(), Texts{"Fail to parse log"});
    EXPECT_EQ(parser.LogGetCount(), 3);
    const std::list<_SYSLOG_LOG_DATA_tag> logs = parser.LogListGet();
    EXPECT_EQ(parser.LogReset(), 0);
    EXPECT_EQ(parser.LogGetCount(), 0);
    EXPECT_EQ(logs.front().msg, "link  is down ");
    EXPECT_EQ(logs.back().tag, "last");
}

TEST(LogParser, RejectsRecordsThatLackWhatIdentifiesALog) {
    LogParser parser;
    _SYSLOG_LOG_DATA_tag whole;
    whole.host = whole.ip = whole.ldate = whole.ltime = whole.prog = whole.msg = "x";
    EXPECT_EQ(parser.isValidLog(whole), 1);
    for (const auto field : {&_SYSLOG_LOG_DATA_tag::host, &_SYSLOG_LOG_DATA_tag::ip, &_SYSLOG_LOG_DATA_tag::ldate,
                             &_SYSLOG_LOG_DATA_tag::ltime, &_SYSLOG_LOG_DATA_tag::prog, &_SYSLOG_LOG_DATA_tag::msg}) {
        _SYSLOG_LOG_DATA_tag record = whole;
        (record.*field).clear();
        EXPECT_EQ(parser.isValidLog(record), 0);
    }
    EXPECT_EQ(TakeSystemLogTexts(), Texts(6, "Invalid log!!!!!!!!!!!!! (Attention Please)"));
}
