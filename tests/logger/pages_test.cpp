#include "logger/event_fixture.h"

using namespace quor::test;

namespace {

class Pages : public EventLog {
  protected:
    // Events at the times 3, 0, 1 and 2.
    Pages() {
        logger_.LogAdd(path_, 0, "u", "e");
        SqliteFile(path_).run("UPDATE log SET time = 3; INSERT INTO log VALUES(NULL, 1, 0, 'u', 'e'), "
                              "(NULL, 1, 1, 'u', 'e'), (NULL, 1, 2, 'u', 'e')");
        TakeSystemLog();
    }

    std::string listed(int offset, int limit) {
        std::string times;
        for (const _SSYSLOG_LOG_LOG_tag& event : logger_.LogEnum(path_, offset, limit)) {
            times += std::to_string(event.time);
        }
        return times;
    }
};

TEST_F(Pages, ListNewestFirstAndBoundNumbers) {
    EXPECT_EQ(listed(0, 0), "3210");
    EXPECT_EQ(listed(2, 0), "3210") << "no limit, no offset";
    EXPECT_EQ(listed(1, 2), "21");
    EXPECT_EQ(listed(3, 2), "0");
    EXPECT_EQ(lastMessage(), "");
    EXPECT_EQ(listed(-1, 5), "") << "too large for an offset";
    EXPECT_EQ(lastMessage(), "Fail to execute SQL command SELECT * FROM log ORDER BY time DESC LIMIT 5 OFFSET "
                             "18446744073709551615");
    EXPECT_TRUE(logger_.LogEnum("/proc/none/events.db", 0, 0).empty());
    EXPECT_EQ(lastMessage(), "Fail to connect db");
    SqliteFile(path_).run("DELETE FROM log; INSERT INTO log VALUES(4000000000, -9999999999, 9999999999, NULL, NULL)");
    const _SSYSLOG_LOG_LOG_tag event = logger_.LogEnum(path_, 0, 0).front();
    EXPECT_EQ(event.id, INT32_MAX);
    EXPECT_EQ(event.level, INT32_MIN);
    EXPECT_EQ(event.time, 9999999999);
    EXPECT_EQ(event.user + event.event, "");
}

TEST_F(Pages, HtmlPageIsExactAndUnescaped) {
    setenv("TZ", "XXX-05:45", 1);
    tzset();
    SqliteFile(path_).run("DELETE FROM log; INSERT INTO log VALUES(1, 1, 4294967296 + 60, 'admin', '<b>&amp;'), "
                          "(2, 7, 0, '', '')");
    const std::string page = folder_.path("page.html");
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", page), 0);
    EXPECT_EQ(ReadFile(page), "<html><head>\n<meta http-equiv=\"Content-Type\" content=\"text/html; charset=utf-8;\">\n"
                              "<title>Syslog Server Log</title>\n</head>\n<body>\n"
                              "<center><h2> Syslog Server Log </h2></center>\n<table border=1 width=95%>\n<tr>\n"
                              "<th>Type</th><th>Time</th><th>User</th><th>Event</th></tr>\n"
                              "<tr>\n<td align=\"center\">Warning</td>\n<td align=\"center\">1970-01-01T05:46:00</td>"
                              "<td align=\"center\">admin</td><td align=\"left\"><b>&amp;</td></tr>\n"
                              "<tr>\n<td align=\"center\"></td>\n<td align=\"center\">1970-01-01T05:45:00</td>"
                              "<td align=\"center\"></td><td align=\"left\"></td></tr>\n"
                              "</table></body></html>\n");
    unsetenv("TZ");
    EXPECT_EQ(logger_.LogHtmlRemove(page), 0);
    EXPECT_EQ(logger_.LogHtmlRemove(page), -1);
    EXPECT_EQ(logger_.LogHtmlGen(path_, "", page), -1);
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", folder_.path("no/folder/page.html")), 0);
    SqliteFile(path_).run("DELETE FROM log");
    EXPECT_EQ(logger_.LogHtmlGen(path_, "x", page), 0);
    EXPECT_FALSE(std::filesystem::exists(page));
}

TEST_F(EventLog, ClearLeavesOnlyWhoDidIt) {
    ASSERT_EQ(logger_.LogAddVolFull(), 0);
    SqliteFile reader(own_);  // still open while the file goes
    ASSERT_EQ(reader.query("SELECT count(*) FROM log"), Strings({"1"}));
    SetClock(7);
    EXPECT_EQ(logger_.LogClear(own_, "admin"), 0);
    EXPECT_EQ(stored(own_), Strings({"0 7 SYSTEM " + own_ + " was cleared by admin"}));
    EXPECT_EQ(logger_.LogClear(own_, "o'brien"), 0);
    EXPECT_EQ(lastMessage().substr(0, 7), "logger:");
    EXPECT_EQ(logger_.LogCount(own_), 0);
}

}  // namespace
