#include <cstdlib>
#include <cstring>

#include "bench/receive/measure.h"
#include "parser.h"

namespace quor::bench {
namespace {

// A copy that may be written to, strtok_r, and strings.
int parsePlainly(const std::string& entry, _SYSLOG_LOG_DATA_tag& record) {
    constexpr size_t kWords = 11;
    std::string copy(entry);
    char* rest = nullptr;
    char* words[kWords];
    for (size_t i = 0; i < kWords; ++i) {
        words[i] = strtok_r(i == 0 ? copy.data() : nullptr, " ", &rest);
        if (words[i] == nullptr) {
            return -1;
        }
    }
    record.fac = words[0];
    record.prio = PriorStrToType(words[1]);
    record.ldate = words[2];
    record.ltime = words[3];
    record.utcsec = strtoll(words[4], nullptr, 10);
    record.xsec = strtoll(words[5], nullptr, 10);
    record.tzoffset = words[6];
    record.host = words[7];
    record.ip = words[8];
    record.prog = words[9];
    record.tag = words[10];
    record.msg = rest;
    return 0;
}

}  // namespace

void MeasureParsing() {
    const std::string entry =
        "local0 warning 2026-11-21 05:15:54 1795238154 1795238154 +00:00 router1.example.net 192.168.100.101 kernel 84 "
        "eth0: link state changed to down, 17 packets...";
    LogParser parser;
    _SYSLOG_LOG_DATA_tag record;
    constexpr int kCalls = 200000;
    Report("ParseSingleEntry beside strtok_r",
           BestSeconds(10, kCalls, [&] { (void)parser.ParseSingleEntry(entry, record); }),
           BestSeconds(10, kCalls, [&] { (void)parsePlainly(entry, record); }), "lines/s", 1);
}

}  // namespace quor::bench
