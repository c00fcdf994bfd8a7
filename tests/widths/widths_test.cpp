// The widths that callers rely on: the same answers on every target, whatever `long`, size_t and time_t are there.
#include <gtest/gtest.h>

#include <filesystem>

#include "dbhandler.h"
#include "logger.h"
#include "notification.h"
#include "parser.h"
#include "support/clock.h"
#include "support/sqlite_file.h"
#include "support/temp_folder.h"

namespace {

using quor::test::SqliteFile;
using std::to_string;

struct Case {
    const char* what;
    std::string got;
    const char* expected;
};

void check(const std::vector<Case>& cases) {
    for (const Case& c : cases) {
        EXPECT_EQ(c.got, c.expected) << c.what;
    }
}

class Widths : public testing::Test {
  protected:
    Widths() {
        setenv("TZ", "UTC", 1);
        SqliteFile file(path_);
        file.run("CREATE TABLE logs(id INTEGER PRIMARY KEY, host, ip, fac, prio, tag, utcsec, tzoffset, ldate, ltime,"
                 " prog, msg); CREATE TABLE transfer_log(id INTEGER PRIMARY KEY, isdir, fsize);"
                 "CREATE TABLE hosts(host_id, host_name); CREATE TABLE histogram(device, count);"
                 "CREATE TABLE eps(stamp, device, eps); CREATE TABLE log(id INTEGER PRIMARY KEY, level, time TEXT,"
                 " user, event); CREATE TABLE db_info(id, start_time, end_time, log_count, device)");
    }
    ~Widths() override { quor::test::ResetClock(); }

    void run(const std::string& sql) { SqliteFile(path_).run(sql); }

    // The ids of the selected rows.
    std::string ids(std::list<_SYSLOG_SQL_COND_tag> conds, unsigned long long limit, unsigned long long offset) {
        return fields(std::move(conds), limit, offset,
                      [](const _SYSLOG_LOG_DATA_tag& log) { return to_string(log.id); });
    }

    using Field = std::string (*)(const _SYSLOG_LOG_DATA_tag&);
    std::string fields(std::list<_SYSLOG_SQL_COND_tag> conds, unsigned long long limit, unsigned long long offset,
                       Field field) {
        std::pair<std::string, Field> found("", field);
        _SYSLOG_SQL_LIMIT_tag window{limit, offset};
        const auto append = [](_SYSLOG_LOG_DATA_tag& log, void* context) {
            auto& into = *static_cast<std::pair<std::string, Field>*>(context);
            into.first += into.second(log) + " ";
            return 0;
        };
        EXPECT_EQ(SyslogDBSelect(path_, conds, &window, nullptr, append, &found, false), 0);
        return found.first;
    }

    const quor::test::TempFolder folder_;
    std::string path_ = folder_.path("test.db");
    const std::list<_SYSLOG_SQL_COND_tag> filter_{{SYSLOG_ATTRI_HOST, 0, "h", {}}};
};

TEST_F(Widths, OfLogRecordsAndWindows) {
    run("INSERT INTO logs(id, host, utcsec) VALUES(1, 'h', '4294967297'), (2147483648, 'h', '-2147483649'),"
        "(4294967297, 'h', '9223372036854775808')");
    const auto utcsec = [](const _SYSLOG_LOG_DATA_tag& log) { return to_string(log.utcsec); };
    std::list<_SYSLOG_SQL_COND_tag> none;
    check({
        {"id, all", ids({}, 0, 0), "1 2147483648 4294967297 "},
        {"utcsec is 64 bits, saturating", fields({}, 0, 0, utcsec), "4294967297 -2147483649 9223372036854775807 "},
        {"a window is counted in 64 bits", ids({}, 2147483650, 0), "2147483648 4294967297 "},
        {"an offset above 2^31", ids({}, 2, 4294967295), "1 "},
        {"a filtered limit is its low 32 bits", ids(filter_, 4294967298, 0), "1 2147483648 "},
        {"a filtered offset is its low 32 bits", ids(filter_, 5, 4294967297), "2147483648 4294967297 "},
        {"a count is the low 32 bits", to_string(SyslogDBSelectCount(path_, none, nullptr, nullptr)), "1"},
    });
    run("DELETE FROM logs WHERE id > 2147483648");
    check({{"a count above 2^31", to_string(SyslogDBSelectCount(path_, none, nullptr, nullptr)), "-2147483648"}});
}

TEST_F(Widths, OfTextEntries) {
    _SYSLOG_LOG_DATA_tag log;
    ASSERT_EQ(LogParser().ParseSingleEntry(
                  "h 10.0.0.1 kern err 2147483648 -2147483649 +00:00 2026-01-01 10:00:00 t p m", log),
              0);
    check({{"utcsec", to_string(log.utcsec), "2147483648"}, {"xsec", to_string(log.xsec), "-2147483649"}});
}

TEST_F(Widths, OfMetadata) {
    run("INSERT INTO db_info VALUES(1, '4294967296', '-4294967296', '18446744073709551615', 'd');"
        "INSERT INTO logs(id, utcsec) VALUES(1, 2147483648)");
    DBHandler db(path_, "");
    ASSERT_EQ(db.DBCon(), 0);
    _ARCH_DB_INFO_tag info;
    EXPECT_EQ(db.DBInfoGet(info), 0);
    check({
        {"times saturate at 32 bits", to_string(info.start_time), "2147483647"},
        {"downwards too", to_string(info.end_time), "-2147483648"},
        {"log_count", to_string(info.log_count), "18446744073709551615"},
        {"the oldest log", to_string(db.DBLogStartTimeGet()), "2147483647"},
        {"as a date", db.DBInfoStartStrGet(), "2038-01-19"},
    });
    EXPECT_EQ(db.DBInfoStartSet(18446744073709551615ULL), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT start_time FROM db_info")[0], "18446744073709551615");
    db.DBDiscon();
}

TEST_F(Widths, OfStatistics) {
    run("INSERT INTO histogram VALUES('a', 4294967297), ('b', 9000000000000000000);"
        "INSERT INTO eps VALUES(2147483647, 'a', '4294967296'), (2147483646, 'a', '-4294967296');"
        "INSERT INTO hosts VALUES(4294967299, 'x')");
    const auto samples = SyslogDBEpsGet(path_, 0, 2147483647);
    ASSERT_EQ(samples.size(), 2U);
    check({
        {"total", to_string(SyslogDBHistTotalGet(path_)), "9000000004294967297"},
        {"one device", to_string(SyslogDBHistGetSingle(path_, "a")), "4294967297"},
        {"top", to_string(SyslogDBHistGet(path_, 1).at("b")), "9000000000000000000"},
        {"a sample's count saturates", to_string(samples.at(2147483647).eps), "2147483647"},
        {"a negative one widens with its sign", to_string(samples.at(2147483646).eps), "18446744071562067968"},
        {"a negative bound is a large one", to_string(SyslogDBEpsGet(path_, -1, 2147483647).size()), "0"},
        {"a key", to_string(SyslogDBExtkeyLookupByName(path_, SYSLOG_EXTKEY_HOST, "x")), "4294967299"},
    });
}

TEST_F(Widths, OfEvents) {
    Logger logger;
    quor::test::SetClock(2147483648);
    EXPECT_EQ(logger.LogAdd(path_, -1, "u", "e"), 0);
    EXPECT_EQ(SqliteFile(path_).query("SELECT level, time FROM log"),
              (std::vector<std::string>{"18446744073709551615", "18446744071562067968"}));
    run("DELETE FROM log; INSERT INTO log VALUES(4294967296, '-4294967296', '4295053696', 'u', 'e')");
    const _SSYSLOG_LOG_LOG_tag event = logger.LogEnum(path_, 0, 0).front();
    const std::string page = folder_.path("page.html");
    EXPECT_EQ(logger.LogHtmlGen(path_, "x", page), 0);
    check({
        {"id saturates at 32 bits", to_string(event.id), "2147483647"},
        {"level", to_string(event.level), "-2147483648"},
        {"time", to_string(event.time), "4295053696"},
    });
    EXPECT_NE(quor::test::ReadFile(page).find("1970-01-02T00:00:00"), std::string::npos) << "low 32 bits of the time";
}

TEST_F(Widths, OfRuleThresholds) {
    NotificationManager manager;
    const std::string rules =
        folder_.write("notify.conf", "[r]\nnotify_type=\"1\"\nnotify_pri=\"4294967295\"\nnotify_eps=\"4294967296\"\n"
                                     "notify_pat=\"\"\nnotify_enable=\"1\"\n");
    ASSERT_EQ(manager.ConfigLoad(rules), 0);
    EXPECT_FALSE(manager.CheckEps(4294967295));
    EXPECT_TRUE(manager.CheckEps(4294967296));
    _SYSLOG_NOTIFY_RULES_tag rule;
    EXPECT_EQ(SyslogNotifyConfGet(rules, "r", rule), 0);
    EXPECT_EQ(rule.notify_eps, 4294967296);
}

TEST_F(Widths, OfFileSizes) {
    const std::string large = folder_.write("large.db", "");
    std::filesystem::resize_file(large, 4294967296 + 1023);
    EXPECT_EQ(SyslogngWorkingDbCheck(large, 4194304), 0);
    EXPECT_TRUE(std::filesystem::exists(large)) << "not above the limit";
    std::filesystem::resize_file(large, 4294967296 + 1024);
    EXPECT_EQ(SyslogngWorkingDbCheck(large, 4194304), 0);
    EXPECT_FALSE(std::filesystem::exists(large));
}

}  // namespace
