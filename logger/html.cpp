#include <unistd.h>

#include <cstdio>

#include "base/guards.h"
#include "common/localtime.h"
#include "logger.h"

namespace {

constexpr char kHead[] = "<html><head>\n"
                         "<meta http-equiv=\"Content-Type\" content=\"text/html; charset=utf-8;\">\n"
                         "<title>Syslog Server Log</title>\n"
                         "</head>\n"
                         "<body>\n"
                         "<center><h2> Syslog Server Log </h2></center>\n"
                         "<table border=1 width=95%>\n"
                         "<tr>\n"
                         "<th>Type</th><th>Time</th><th>User</th><th>Event</th>"
                         "</tr>\n";

// Texts go out as they are: the page shows whatever markup an event holds.
void writeRow(FILE* page, const _SSYSLOG_LOG_LOG_tag& event) {
    const std::string time = quor::LocalTimeText(event.time, "%Y-%m-%dT%H:%M:%S");
    (void)fprintf(page,
                  "<tr>\n<td align=\"center\">%s</td>\n<td align=\"center\">%s</td><td align=\"center\">%s</td>"
                  "<td align=\"left\">%s</td></tr>\n",
                  strLevelGet(event.level).c_str(), time.c_str(), event.user.c_str(), event.event.c_str());
}

}  // namespace

int Logger::LogHtmlGen(std::string dbPath, std::string extra, std::string outPath) {
    if (dbPath.empty() || extra.empty() || outPath.empty()) {
        return -1;
    }
    const std::list<_SSYSLOG_LOG_LOG_tag> events = LogEnum(dbPath, 0, 0);
    if (events.empty()) {
        return 0;
    }
    const quor::File page(fopen(outPath.c_str(), "w+e"));
    if (page == nullptr) {
        return 0;
    }
    (void)fputs(kHead, page.get());
    for (const _SSYSLOG_LOG_LOG_tag& event : events) {
        writeRow(page.get(), event);
    }
    (void)fputs("</table></body></html>\n", page.get());
    return 0;
}

int Logger::LogHtmlRemove(std::string outPath) {
    return outPath.empty() ? -1 : unlink(outPath.c_str());
}
