#include "eventpage.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "dates.h"
#include "failure.h"
#include "output.h"
#include "text.h"

namespace quor::cli {
namespace {

constexpr char kHead[] = "<!DOCTYPE html>\n<html><head>\n<meta charset=\"utf-8\">\n<title>Syslog Server Log</title>\n"
                         "</head>\n<body>\n<center><h2> Syslog Server Log </h2></center>\n<table border=1 width=95%>\n"
                         "<tr>\n<th>Type</th><th>Time</th><th>User</th><th>Event</th></tr>\n";

class OpenFile {
  public:
    explicit OpenFile(const std::string& path)
        : fd_(open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666)) {
        if (fd_ < 0) {
            throw Failure("cannot write " + Visible(path) + ": " + strerror(errno) + "; give another file");
        }
    }
    OpenFile(const OpenFile&) = delete;
    OpenFile& operator=(const OpenFile&) = delete;
    ~OpenFile() { close(fd_); }
    int get() const { return fd_; }

  private:
    int fd_;
};

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
    const OpenFile file(path);
}

void WriteEventPage(const std::list<_SSYSLOG_LOG_LOG_tag>& events, const std::string& path) {
    const OpenFile file(path);
    Output out(file.get());
    out.buffer() = kHead;
    for (const _SSYSLOG_LOG_LOG_tag& event : events) {
        out.buffer() += "<tr>";
        for (const std::string& text : {strLevelGet(event.level), LocalTime(event.time), event.user, event.event}) {
            appendCell(out.buffer(), text);
        }
        out.buffer() += "</tr>\n";
        out.drain();
    }
    out.buffer() += "</table></body></html>\n";
    out.flush();
}

}  // namespace quor::cli
