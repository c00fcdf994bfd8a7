#include <unistd.h>

#include <array>
#include <cstdio>
#include <ctime>

#include "common/handles.h"
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

using Text = std::array<char, 1024>;

// Local time of the low 32 bits.
Text timeText(int64_t seconds) {
    const time_t when = static_cast<int32_t>(seconds);
    Text text{};
    if (const tm* local = localtime(&when)) {
        (void)strftime(text.data(), text.size(), "%Y-%m-%dT%H:%M:%S", local);
    }
    return text;
}

// Texts go out as they are: the page shows whatever markup an event holds.
void writeRow(FILE* page, const _SSYSLOG_LOG_LOG_tag& event) {
    Text level{};
    (void)szLevelGet(event.level, level.data(), static_cast<int>(level.size()));
    (void)fprintf(page,
                  "<tr>\n<td align=\"center\">%s</td>\n<td align=\"center\">%s</td><td align=\"center\">%s</td>"
                  "<td align=\"left\">%s</td></tr>\n",
                  level.data(), timeText(event.time).data(), event.user.c_str(), event.event.c_str());
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
