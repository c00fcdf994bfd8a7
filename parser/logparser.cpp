#include <string_view>

#include "base/numbers.h"
#include "base/words.h"
#include "common.h"
#include "parser.h"

namespace {

// Takes the words of a text as strtok_r() does for a blank, without writing to it: like there, the text ends at its
// first zero byte.
class Words {
  public:
    explicit Words(const char* text) : next_(text) {}

    // Each puts the next word into `field`. False, and `field` as it was, when no word is left.
    bool take(std::string& field) {
        return takeWord([&field](std::string_view word) { field.assign(word); });
    }
    bool take(long long& field) {
        return takeWord([&field](std::string_view word) { field = toNumber(word); });
    }
    bool take(_SYSLOG_DB_PRIORITY_tag& field) {
        return takeWord([&field](std::string_view word) { field = PriorStrToType(std::string(word).c_str()); });
    }

    // What follows the blank after the last word.
    const char* rest() const { return next_; }

  private:
    template <typename Put>
    bool takeWord(Put put) {
        const std::string_view word = nextWord();
        if (!word.empty()) {
            put(word);
        }
        return !word.empty();
    }

    std::string_view nextWord() {
        while (*next_ == ' ') {
            ++next_;
        }
        const char* const word = next_;
        while (*next_ != ' ' && *next_ != '\0') {
            ++next_;
        }
        const auto length = static_cast<size_t>(next_ - word);
        if (*next_ == ' ') {
            ++next_;
        }
        return {word, length};
    }

    // A number ends with its word, unless white space inside the word lets the conversion skip to the next one.
    static long long toNumber(std::string_view word) {
        return word.front() > ' ' ? quor::ToInt64(word.data()) : quor::ToInt64(std::string(word).c_str());
    }

    const char* next_;
};

}  // namespace

LogParser::LogParser() = default;

LogParser::~LogParser() = default;

int LogParser::ParseSingleEntry(const std::string& entry, _SYSLOG_LOG_DATA_tag& record) {
    Words words(entry.c_str());
    const bool complete = words.take(record.fac) && words.take(record.prio) && words.take(record.ldate) &&
                          words.take(record.ltime) && words.take(record.utcsec) && words.take(record.xsec) &&
                          words.take(record.tzoffset) && words.take(record.host) && words.take(record.ip) &&
                          words.take(record.prog) && words.take(record.tag);
    if (!complete) {
        return -1;
    }
    record.msg.assign(words.rest());
    return 0;
}

std::list<std::string> LogParser::Tokenize(const std::string& text, const std::string& delimiters) {
    std::list<std::string> pieces;
    quor::EachWord(text, delimiters, [&pieces](std::string_view piece) { pieces.emplace_back(piece); });
    return pieces;
}

int LogParser::isValidLog(_SYSLOG_LOG_DATA_tag& record) {
    const bool complete = !record.host.empty() && !record.ip.empty() && !record.ldate.empty() &&
                          !record.ltime.empty() && !record.prog.empty() && !record.msg.empty();
    if (complete) {
        return 1;
    }
    Debuger::MSG(0, "Invalid log!!!!!!!!!!!!! (Attention Please)");
    partialList_.push_back(record);
    return 0;
}

int LogParser::LogAdd(std::string& chunk) {
    if (!compensation_.empty()) {
        Debuger::MSG(2, "Paritial log compensation: " + compensation_ + " " + chunk);
        chunk.insert(0, compensation_);
    }
    for (const std::string& line : Tokenize(chunk, "\n")) {
        _SYSLOG_LOG_DATA_tag record;
        if (ParseSingleEntry(line, record) == 0) {
            logList_.push_back(std::move(record));
        } else {
            Debuger::MSG(0, "Fail to parse log");
        }
    }
    return 0;
}

int LogParser::LogGetCount() {
    return static_cast<int>(logList_.size());
}

std::list<_SYSLOG_LOG_DATA_tag> LogParser::LogListGet() {
    return logList_;
}

int LogParser::LogReset() {
    logList_.clear();
    return 0;
}

void LogParser::LogDump() {
    Debuger::MSG(2, "Log count: " + ullNumberToString(logList_.size()));
    for (const _SYSLOG_LOG_DATA_tag& record : logList_) {
        Debuger::MSG(2, "Log countent: " + record.msg);
    }
}

void LogParser::PartialLogDump() {
    Debuger::MSG(2, "Partial log count: " + ullNumberToString(partialList_.size()));
    for (const _SYSLOG_LOG_DATA_tag& record : partialList_) {
        Debuger::MSG(2, "Log countent: " + record.host + " " + record.ip + " " + record.ldate + " " + record.ltime +
                            " " + record.prog + " " + record.msg);
    }
}
