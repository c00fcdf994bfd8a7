#include "tools/quorlog/examples.h"

#include <utility>

namespace quor::cli {
namespace {

using Example = std::pair<std::string_view, std::string_view>;

constexpr Example kCommands[] = {
    {"quorlog", "search --host nas1 --level err+ --last 1h"},
    {"quorlog search", "--host nas1 --level err+ --last 1h"},
    {"quorlog count", "--by host --last 1d"},
    {"quorlog delete", "--program chatty --to 2026-01-31"},
    {"quorlog values", "host"},
    {"quorlog names", "host"},
    {"quorlog stats", "top"},
    {"quorlog stats total", ""},
    {"quorlog stats device", "nas1"},
    {"quorlog stats top", "--limit 20"},
    {"quorlog stats eps", "--last 1h --every 1m"},
    {"quorlog stats devices", ""},
    {"quorlog events", "list"},
    {"quorlog events list", "--limit 20"},
    {"quorlog events html", "/tmp/events.html --safe"},
    {"quorlog events clear", ""},
    {"quorlog rules", "list"},
    {"quorlog rules list", ""},
    {"quorlog rules set", "disk --keyword 'I/O error'"},
    {"quorlog rules silent", "routers --host 'router-*' --after 30m"},
    {"quorlog rules rate", "loud --factor 10"},
    {"quorlog rules newdevice", "new --not-host 'lab-*'"},
    {"quorlog rules delete", "disk"},
    {"quorlog rules rename", "disk disks"},
    {"quorlog rules disable", "disk"},
    {"quorlog rules enable", "disk"},
    {"quorlog rules test", "--message 'I/O error on sda'"},
    {"quorlog rules try", "logins --last 1w"},
    {"quorlog notify", "test"},
    {"quorlog notify test", ""},
    {"quorlog db", "info"},
    {"quorlog db create", "--db /srv/logs/new.db"},
    {"quorlog db info", ""},
    {"quorlog db checkpoint", ""},
    {"quorlog db check", "--full"},
    {"quorlog db salvage", "syslog.db.corrupt saved.db"},
    {"quorlog db merge", "saved.db"},
    {"quorlog db compact", ""},
    {"quorlog db wal", ""},
    {"quorlog db limit", "2097152"},
    {"quorlog backup", "/srv/backup/syslog.db"},
    {"quorlog restore", "/srv/backup/syslog.db"},
    {"quorlog doctor", ""},
    {"quorlog parse", "<entries"},
};

constexpr Example kOptions[] = {
    {"--host", "nas1,web"},
    {"--level", "err+"},
    {"--facility", "kern,auth"},
    {"--program", "sshd,cron"},
    {"--pid", "1234"},
    {"--ip", "'192.168.1.*'"},
    {"--msgid", "ID47"},
    {"--sdata", "'user=\"ann\"'"},
    {"--keyword", "'link down'"},
    {"--glob", "'*link*down*'"},
    {"--regex", "'link (up|down)'"},
    {"--from", "yesterday"},
    {"--to", "'2026-01-31 18:00'"},
    {"--last", "2h"},
    {"--not-host", "nas1,web"},
    {"--not-level", "debug"},
    {"--not-facility", "cron"},
    {"--not-program", "cron"},
    {"--not-keyword", "'link up'"},
    {"--not-regex", "'^session (opened|closed)'"},
    {"--db", "/srv/backup/syslog.db"},
    {"--table", "connection_log"},
    {"--format", "json"},
    {"--limit", "100"},
    {"--offset", "100"},
    {"--before", "12345"},
    {"--interval", "5m"},
    {"search --interval", "5"},
    {"--columns", "time,host,message"},
    {"--context", "3"},
    {"--before-context", "3"},
    {"--after-context", "3"},
    {"--newest", "10000"},
    {"--by", "host"},
    {"--every", "1m"},
    {"--eps", "500"},
    {"--message", "'link down'"},
    {"--count", "10"},
    {"--within", "5m"},
    {"--after", "30m"},
    {"--factor", "10"},
    {"--control", "/run/syslog-ng.ctl"},
};

const Example* find(const Example* begin, const Example* end, std::string_view name) {
    while (begin != end && begin->first != name) {
        ++begin;
    }
    return begin == end ? nullptr : begin;
}

std::string joined(const Example* example) {
    std::string text;
    if (example != nullptr) {
        text.append(example->first).append(example->second.empty() ? "" : " ").append(example->second);
    }
    return text;
}

}  // namespace

std::string ExampleOfCommand(std::string_view command) {
    return joined(find(std::begin(kCommands), std::end(kCommands), command));
}

std::string ExampleOfOption(const std::string& command, const std::string& option) {
    const Example* ofCommand = find(std::begin(kOptions), std::end(kOptions), command + " " + option);
    return joined(ofCommand != nullptr ? ofCommand : find(std::begin(kOptions), std::end(kOptions), option));
}

}  // namespace quor::cli
