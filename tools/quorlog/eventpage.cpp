#include "tools/quorlog/eventpage.h"

#include <fcntl.h>

#include <cerrno>
#include <cstring>

#include "base/guards.h"
#include "store/dates.h"
#include "store/failure.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/output.h"

namespace quor::cli {
namespace {

constexpr char kHead[] = "<!DOCTYPE html>\n<html><head>\n<meta charset=\"utf-8\">\n<title>Syslog Server Log</title>\n"
                         "</head>\n<body>\n<center><h2> Syslog Server Log </h2></center>\n<table border=1 width=95%>\n"
                         "<tr>\n<th>Type</th><th>Time</th><th>User</th><th>Event</th></tr>\n";

Descriptor openPage(const std::string& path) {
    Descriptor page(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666));
    if (!page) {
        throw store::Failure("cannot write " + path + ": " + strerror(errno) + "; give another file",
                             store::Cause::Denied);
    }
    return page;
}

void appendCell(std::string& out, const std::string& text) {
    out += "<td>";
    for (const char c : Visible(text)) {
        switch (c) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        default:
            out += c;
        }
    }
    out += "</td>";
}

}  // namespace

void RequireWritable(const std::string& path) {
    (void)openPage(path);
}

void WriteEventPage(const std::list<_SSYSLOG_LOG_LOG_tag>& events, const std::string& path) {
    const Descriptor file = openPage(path);
    Output out(file.get());
    out.buffer() = kHead;
    for (const _SSYSLOG_LOG_LOG_tag& event : events) {
        out.buffer() += "<tr>";
        for (const std::string& text :
             {strLevelGet(event.level), store::LocalTime(event.time), event.user, event.event}) {
            appendCell(out.buffer(), text);
        }
        out.buffer() += "</tr>\n";
        out.drain();
    }
    out.buffer() += "</table></body></html>\n";
    out.flush();
}

}  // namespace quor::cli
