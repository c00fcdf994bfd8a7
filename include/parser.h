// Parsing of text log entries: one entry a line, twelve fields separated by blanks. Conventions: see common.h.
#ifndef QUORSYSLOG_PARSER_H
#define QUORSYSLOG_PARSER_H

#include <list>
#include <string>

#include "dbutil.h"

#pragma GCC visibility push(default)

// Parses entries and accumulates them.
//
// Fields of an entry: fac prio ldate ltime utcsec xsec tzoffset host ip prog tag msg. The first eleven are words; the
// message is the rest of the line, blanks included, and may be empty.
class LogParser {
  public:
    LogParser();
    ~LogParser();

    // Fills `record` from one entry. -1 when a field is missing; the fields found before it keep their new values. No
    // field is checked for content.
    int ParseSingleEntry(const std::string& entry, _SYSLOG_LOG_DATA_tag& record);
    // The pieces between delimiter characters; unlike ::Tokenize, never an empty one.
    std::list<std::string> Tokenize(const std::string& text, const std::string& delimiters);
    // 1 when host, ip, ldate, ltime, prog and msg are all there; else 0, and a copy of the record is set aside.
    int isValidLog(_SYSLOG_LOG_DATA_tag& record);

    // Parses every line of `chunk` and keeps the records; lines that do not parse are reported and dropped. Always 0.
    int LogAdd(std::string& chunk);
    // The records kept so far: their number, and a copy of them.
    int LogGetCount();
    std::list<_SYSLOG_LOG_DATA_tag> LogListGet();
    // Forgets the records that LogAdd() kept, not those set aside. Always 0.
    int LogReset();
    // Write the kept and the set-aside records as debug messages, at a level that the sink drops.
    void LogDump();
    void PartialLogDump();

  private:
    std::string compensation_;  // put before the next chunk; nothing fills it yet
    std::list<_SYSLOG_LOG_DATA_tag> partialList_;
    std::list<_SYSLOG_LOG_DATA_tag> logList_;
};

#pragma GCC visibility pop

#endif
