#include "bench/search/rows.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <iterator>

namespace quor::bench {
namespace {

constexpr size_t kRareOneIn = 50'000;

// The commoner first.
constexpr const char* kHosts[] = {
    kCommonHost,    "fileserver-1", "mailgate",   "fw-inside",  "fw-outside",  "web-01",       "web-02",
    "web-03",       "db-primary",   "db-replica", "backup-nas", "printer-2nd", "wifi-ap-01",   "wifi-ap-02",
    "wifi-ap-03",   "wifi-ap-04",   "dns-a",      "dns-b",      "monitor",     "build-agent",  "camera-gate",
    "camera-yard",  "camera-dock",  "voip-pbx",   "ldap-1",     "ldap-2",      "hypervisor-a", "hypervisor-b",
    "hypervisor-c", "warehouse-gw", "office-gw",  "ups-rack",   "thermostat",  "door-control", "time-server",
    "proxy",        "cache-01",     "cache-02",   "staging",    "jumphost"};

struct Program {
    const char* name;
    const char* fac;
    const char* prio;
    const char* pattern;  // $n: a number, $u: a user, $i: an address, $x: an identifier
};

constexpr Program kRare = {kRareProgram, "kern", "err", "Hardware event on CPU $n bank $n: memory error at $x"};
constexpr Program kPrograms[] = {
    {"sshd", "auth", "info", "Accepted publickey for $u from $i port $n ssh2: RSA SHA256:$x$x"},
    {"kernel", "kern", "warning",
     "[UFW BLOCK] IN=eth0 OUT= MAC=$x SRC=$i DST=$i LEN=$n TTL=$n ID=$n DF PROTO=TCP SPT=$n DPT=$n"},
    {"CRON", "cron", "info", "($u) CMD (cd / && run-parts --report /etc/cron.hourly)"},
    {"postfix/smtpd", "mail", "info", "connect from mail-$n.example.net[$i], client=$u, message-id=<$x>"},
    {"sshd", "auth", "info", "Failed password for invalid user $u from $i port $n ssh2"},
    {"dhcpd", "daemon", "info", "DHCPACK on $i to $x ($u-laptop) via eth1 lease-duration $n"},
    {"named", "daemon", "notice", "client @0x$x $i#$n (www.example.org): query (cache) 'www.example.org/A/IN' denied"},
    {"systemd", "daemon", "info", "session-$n.scope: Succeeded. Consumed $nms CPU time, received $n bytes of traffic"},
    {"smbd", "local5", "notice", "$u|$i|share-$n|pread|ok|projects/$n/$x.dat|$n bytes in $n ms"},
    {"nginx", "daemon", "info", "$i - $u \"GET /static/$x.js HTTP/1.1\" 200 $n \"https://www.example.org/$n\" Mozilla"},
    {"postfix/qmgr", "mail", "info", "$x: from=<$u@example.org>, size=$n, nrcpt=1 (queue active)"},
    {"sudo", "authpriv", "notice", "$u : TTY=pts/$n ; PWD=/home/$u ; USER=root ; COMMAND=/usr/bin/systemctl status $x"},
    {"snmpd", "daemon", "debug", "Connection from UDP: [$i]:$n->[$i]:161"},
    {"ntpd", "daemon", "info", "adjusting local clock by 0.$ns, offset $n"},
    {"smartd", "daemon", "err", "Device: /dev/sd$n [SAT], SMART Attribute: 194 Temperature changed from $n to $n"},
    {"bgpd", "local7", "crit", "%BGP-5-ADJCHANGE: neighbor $i Down: hold timer expired, last reset $x"},
};

constexpr const char* kUsers[] = {"root", "admin", "mueller", "svc-backup", "tanaka", "oconnor", "guest", "postgres"};

std::string format(const char* pattern, int64_t seconds) {
    const auto when = static_cast<time_t>(seconds);
    tm parts{};
    gmtime_r(&when, &parts);
    char text[32];
    return {text, strftime(text, sizeof text, pattern, &parts)};
}

}  // namespace

// Small numbers far more often than large ones.
size_t RowSource::pickSkewed(size_t count) {
    return std::min({pick(count), pick(count), pick(count)});
}

std::string RowSource::placeholder(char kind) {
    char text[32];
    switch (kind) {
    case 'u':
        return kUsers[pick(std::size(kUsers))];
    case 'i':
        snprintf(text, sizeof text, "10.%zu.%zu.%zu", pick(16), pick(256), pick(256));
        return text;
    case 'x':
        snprintf(text, sizeof text, "%08zx", pick(UINT32_MAX));
        return text;
    default:
        return std::to_string(pick(60'000));
    }
}

std::string RowSource::message(const char* pattern) {
    std::string text;
    for (; *pattern != '\0'; ++pattern) {
        if (*pattern == '$') {
            text += placeholder(*++pattern);
        } else {
            text += *pattern;
        }
    }
    return text;
}

void RowSource::setHost() {
    const size_t host = pickSkewed(std::size(kHosts));
    const bool rare = pick(kRareOneIn) == 0;
    row_.host = rare ? kRareHost : kHosts[host];
    row_.ip = "10.0.0." + std::to_string(rare ? 250 : host + 1);
}

void RowSource::setProgram() {
    const Program& program = pick(kRareOneIn) == 0 ? kRare : kPrograms[pickSkewed(std::size(kPrograms))];
    row_.prog = program.name;
    row_.fac = program.fac;
    row_.prio = program.prio;
    row_.msg = message(program.pattern);
}

void RowSource::setTime() {
    row_.utcsec = kFirstSecond + made_ * kDays * 86'400 / total_;
    row_.ldate = format("%Y-%m-%d", row_.utcsec);
    row_.ltime = format("%H:%M:%S", row_.utcsec);
}

const Row& RowSource::next() {
    setHost();
    setProgram();
    setTime();
    row_.tag = "0e";
    row_.tzoffset = "+00:00";
    ++made_;
    return row_;
}

}  // namespace quor::bench
