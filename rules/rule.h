// One rule: what it looks for, and in the logs of whom.
#ifndef RULES_RULE_H
#define RULES_RULE_H

#include <array>
#include <cstdint>
#include <string>

namespace quor::rules {

enum class Kind {
    Match,      // logs that meet every condition; or so many of one device in a span of time
    Silent,     // a device that sends nothing any more
    Rate,       // a device that sends far more than it usually does
    NewDevice,  // a device that was never heard before
};
constexpr std::array<const char*, 4> kKindNames = {"match", "silent", "rate", "newdevice"};  // by Kind

constexpr int64_t kLearnt = 0;  // of `after`: from the device's own rhythm

// An empty text and -1 stand for what was not given.
struct Rule {
    std::string name;
    Kind kind = Kind::Match;
    bool enabled = true;
    // Names with commas between them, in which "*" and "?" stand for any text.
    std::string host;
    std::string notHost;
    std::string program;
    std::string notProgram;
    std::string facility;
    std::string notFacility;
    int level = -1;  // this one or a worse one
    // Parts of the message, the message id or the structured data; the glob is the message as a whole.
    std::string keyword;
    std::string notKeyword;
    std::string glob;
    bool ignoreCase = false;
    int64_t count = -1;     // logs of one device ...
    int64_t within = -1;    // ... whose seconds differ by less than this
    int64_t after = -1;     // seconds of silence
    int64_t factor = -1;    // times the usual rate
    int64_t interval = -1;  // seconds between two notices
};

// A value of a rule. Its key in the file is its option on the command line, without the dashes.
struct Field {
    const char* key;
    bool (*isFor)(Kind kind);
    // Empty when it is not given.
    std::string (*text)(const Rule& rule);
    // Failure, which calls it `name`, for a text that is none.
    void (*set)(Rule& rule, const std::string& text, const std::string& name);
};
constexpr size_t kFieldCount = 16;
const std::array<Field, kFieldCount>& Fields();
// The field of that key which the kind has, or null.
const Field* FieldOf(Kind kind, const std::string& key);

// Failure when something is missing without which it would never fire, or always.
void CheckComplete(const Rule& rule);
// Failure for a name that the file could not hold, or that nobody could read.
void CheckName(const std::string& name);

// The number of one level, which stands for the worse ones too, as in notify.conf; the "+" with which a search says so
// may be given. Failure, which calls it `name`, for anything else.
int ParseLevel(const std::string& text, const std::string& name);

// What it looks for, in one line.
std::string Describe(const Rule& rule);
// Seconds in the largest unit that holds them exactly: "5m".
std::string SpanText(int64_t seconds);
// Seconds between two notices of the rule.
int64_t IntervalOf(const Rule& rule);

}  // namespace quor::rules

#endif
