// Entries in chunks, against the C library's tokenizer.
#include "parser.h"

#include <cstdlib>
#include <cstring>

#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

bool reference(std::string line, _SYSLOG_LOG_DATA_tag& record) {
    std::string number[2];
    std::string prio;
    std::string* const fields[] = {&record.fac,      &prio,        &record.ldate, &record.ltime, &number[0], &number[1],
                                   &record.tzoffset, &record.host, &record.ip,    &record.prog,  &record.tag};
    char* rest = nullptr;
    char* text = line.data();
    for (std::string* field : fields) {
        const char* word = strtok_r(text, " ", &rest);
        text = nullptr;
        if (word == nullptr) {
            return false;
        }
        *field = word;
    }
    record.msg = rest;
    record.prio = PriorStrToType(prio.c_str());
    record.utcsec = strtoll(number[0].c_str(), nullptr, 10);
    record.xsec = strtoll(number[1].c_str(), nullptr, 10);
    return true;
}

bool same(const _SYSLOG_LOG_DATA_tag& a, const _SYSLOG_LOG_DATA_tag& b) {
    return a.fac == b.fac && a.prio == b.prio && a.ldate == b.ldate && a.ltime == b.ltime && a.utcsec == b.utcsec &&
           a.xsec == b.xsec && a.tzoffset == b.tzoffset && a.host == b.host && a.ip == b.ip && a.prog == b.prog &&
           a.tag == b.tag && a.msg == b.msg;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string chunk(reinterpret_cast<const char*>(data), size);
    LogParser parser;
    std::string given = chunk;
    Require(parser.LogAdd(given) == 0 && given == chunk, "a chunk is taken and stays as it is");
    const std::list<_SYSLOG_LOG_DATA_tag> records = parser.LogListGet();
    auto record = records.begin();
    for (const std::string& line : parser.Tokenize(chunk, "\n")) {
        _SYSLOG_LOG_DATA_tag expected;
        if (reference(line, expected)) {
            Require(record != records.end() && same(*record, expected), "the record is that of the line");
            _SYSLOG_LOG_DATA_tag checked = *record++;
            parser.isValidLog(checked);
        }
    }
    Require(record == records.end() && parser.LogGetCount() == static_cast<int>(records.size()), "no other record");
    return 0;
}
