#include "parser.h"

#include <gtest/gtest.h>

#include <cstring>
#include <random>

#include "support/system_log.h"

namespace {

using quor::test::TakeSystemLogTexts;
using Texts = std::vector<std::string>;

const std::string kFields = "local0 err 2026-11-21 05:15:54 1795238154 17 +00:00 router1 10.0.0.1 kernel";
const std::string kEntry = kFields + " 84 link  is down ";

// Every field that parsing may touch.
auto content(const _SYSLOG_LOG_DATA_tag& r) {
    return std::tie(r.fac, r.prio, r.ldate, r.ltime, r.utcsec, r.xsec, r.tzoffset, r.host, r.ip, r.prog, r.tag, r.msg,
                    r.id, r.luser);
}

// The plain way, on a copy of the text that may be written to.
int parseInPlace(std::string text, _SYSLOG_LOG_DATA_tag& record) {
    std::string prio;
    std::string utcsec;
    std::string xsec;
    char* rest = nullptr;
    char* begin = text.data();
    for (std::string* field : {&record.fac, &prio, &record.ldate, &record.ltime, &utcsec, &xsec, &record.tzoffset,
                               &record.host, &record.ip, &record.prog, &record.tag}) {
        const char* word = strtok_r(std::exchange(begin, nullptr), " ", &rest);
        if (word == nullptr) {
            return -1;
        }
        *field = word;
        record.prio = field == &prio ? PriorStrToType(word) : record.prio;
        record.utcsec = field == &utcsec ? strtoll(word, nullptr, 10) : record.utcsec;
        record.xsec = field == &xsec ? strtoll(word, nullptr, 10) : record.xsec;
    }
    record.msg = rest;
    return 0;
}

std::string randomEntry(std::mt19937& random) {
    static const std::string kPieces = "        \t+\xff\x80\n-79ae";  // blanks above all
    static const Texts kWords{"err", "debug", "12", "x\ty", "99999999999999999999"};
    // Zero bytes stay rare, or few entries would be whole.
    std::string entry;
    for (auto left = random() % 60; left > 0; --left) {
        const std::string piece(1, random() % 100 == 0 ? '\0' : kPieces[random() % kPieces.size()]);
        entry += random() % 3 == 0 ? kWords[random() % kWords.size()] : piece;
    }
    return entry;
}

}  // namespace

TEST(ParseSingleEntry, AgreesWithStrtokOnAnyText) {
    std::mt19937 random(1);  // the same texts in every run
    LogParser parser;
    int whole = 0;
    for (int i = 0; i < 30000; ++i) {
        const std::string entry = i == 0 ? kEntry : randomEntry(random);
        _SYSLOG_LOG_DATA_tag record;
        record.id = 7, record.fac = record.tag = record.msg = record.luser = "old", record.utcsec = record.xsec = -1;
        _SYSLOG_LOG_DATA_tag expected = record;
        const int status = parseInPlace(entry, expected);
        ASSERT_EQ(parser.ParseSingleEntry(entry, record), status) << testing::PrintToString(entry);
        ASSERT_EQ(content(record), content(expected)) << testing::PrintToString(entry);
        whole += status == 0 ? 1 : 0;
    }
    EXPECT_GT(whole, 2000);
}

TEST(LogParser, TokenizeDropsEmptyPieces) {
    using Pieces = std::list<std::string>;
    EXPECT_EQ(LogParser().Tokenize("\n\n", "\n"), Pieces());
    EXPECT_EQ(LogParser().Tokenize(",;a;,b,c", ",;"), (Pieces{"a", "b", "c"}));
    EXPECT_EQ(LogParser().Tokenize("whole", ""), Pieces{"whole"});
}

TEST(LogParser, KeepsTheLinesThatParse) {
    LogParser parser;
    std::string chunk = "\n" + kEntry + "\n\ntoo short\n" + kEntry + "\n" + kFields + " last";
    TakeSystemLogTexts();
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
    TakeSystemLogTexts();
    EXPECT_EQ(parser.isValidLog(whole), 1);
    for (const auto field : {&_SYSLOG_LOG_DATA_tag::host, &_SYSLOG_LOG_DATA_tag::ip, &_SYSLOG_LOG_DATA_tag::ldate,
                             &_SYSLOG_LOG_DATA_tag::ltime, &_SYSLOG_LOG_DATA_tag::prog, &_SYSLOG_LOG_DATA_tag::msg}) {
        _SYSLOG_LOG_DATA_tag record = whole;
        (record.*field).clear();
        EXPECT_EQ(parser.isValidLog(record), 0);
        EXPECT_EQ(TakeSystemLogTexts(), Texts{"Invalid log!!!!!!!!!!!!! (Attention Please)"});
    }
}
