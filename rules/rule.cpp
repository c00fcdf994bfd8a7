#include "rules/rule.h"

#include <algorithm>
#include <iterator>

#include "base/numbers.h"
#include "base/utf8.h"
#include "dbutil.h"
#include "store/dates.h"
#include "store/failure.h"
#include "store/names.h"

namespace quor::rules {
namespace {

using store::Failure;

constexpr int64_t kMinute = 60;
constexpr int64_t kDay = 86400;
constexpr size_t kMostText = 4096;

struct Range {
    int64_t least;
    int64_t most;
};
constexpr Range kCounts{1, 1000};
constexpr Range kWithin{1, kDay};
constexpr Range kAfter{kMinute, 60 * kDay};
constexpr Range kFactors{2, 1000};
constexpr Range kIntervals{0, 7 * kDay};

bool forAll(Kind) {
    return true;
}

template <Kind Wanted>
bool forOne(Kind kind) {
    return kind == Wanted;
}

template <auto Member>
std::string plainText(const Rule& rule) {
    return rule.*Member;
}

void checkText(const std::string& text, const std::string& name) {
    if (text.empty()) {
        throw Failure(name + ": the value is empty; leave it out, or give one");
    }
    if (text.size() > kMostText) {
        throw Failure(name + ": too long; give at most " + std::to_string(kMostText) + " bytes");
    }
    if (text.find_first_of(std::string("\r\n\0", 3)) != std::string::npos) {
        throw Failure(name + ": a rule holds one line; give a text without line breaks");
    }
}

template <auto Member>
void setText(Rule& rule, const std::string& text, const std::string& name) {
    checkText(text, name);
    rule.*Member = text;
}

template <auto Member>
void setNames(Rule& rule, const std::string& text, const std::string& name) {
    checkText(text, name);
    if (store::NamesOf({text}, name, false).empty()) {
        throw Failure(name + ": 'any' means every name; leave it out");
    }
    rule.*Member = text;
}

int64_t inRange(int64_t value, const Range& range, const std::string& name, std::string (*write)(int64_t)) {
    if (value < range.least || value > range.most) {
        throw Failure(name + ": out of range; give " + write(range.least) + " to " + write(range.most));
    }
    return value;
}

std::string decimal(int64_t value) {
    return std::to_string(value);
}

template <auto Member>
std::string numberText(const Rule& rule) {
    return rule.*Member < 0 ? "" : decimal(rule.*Member);
}

template <auto Member, const Range& Allowed>
void setNumber(Rule& rule, const std::string& text, const std::string& name) {
    if (text.empty() || text.size() > 6 || text.find_first_not_of("0123456789") != std::string::npos) {
        throw Failure(name + ": not a number: '" + text + "'; give digits only");
    }
    rule.*Member = inRange(ToInt64(text.c_str()), Allowed, name, decimal);
}

template <auto Member>
std::string spanText(const Rule& rule) {
    return rule.*Member < 0 ? "" : SpanText(rule.*Member);
}

template <auto Member, const Range& Allowed>
void setSpan(Rule& rule, const std::string& text, const std::string& name) {
    rule.*Member = inRange(static_cast<int64_t>(store::ParseSpan(text, name)), Allowed, name, SpanText);
}

std::string levelText(const Rule& rule) {
    return rule.level < 0 ? "" : std::string(g_MappingSyslogPrior[rule.level]) + "+";
}

void setLevel(Rule& rule, const std::string& text, const std::string& name) {
    rule.level = ParseLevel(text, name);
}

std::string caseText(const Rule& rule) {
    return rule.ignoreCase ? "yes" : "";
}

void setCase(Rule& rule, const std::string& text, const std::string& name) {
    if (text != "yes" && text != "no") {
        throw Failure(name + ": '" + text + "' is neither yes nor no");
    }
    rule.ignoreCase = text == "yes";
}

void setGlob(Rule& rule, const std::string& text, const std::string& name) {
    checkText(text, name);
    if (!IsUtf8(text)) {
        throw Failure(name + ": the pattern is not UTF-8; give a keyword, which takes any bytes");
    }
    rule.glob = text;
}

std::string afterText(const Rule& rule) {
    return rule.after == kLearnt ? "auto" : spanText<&Rule::after>(rule);
}

void setAfter(Rule& rule, const std::string& text, const std::string& name) {
    if (text == "auto") {
        rule.after = kLearnt;
    } else {
        setSpan<&Rule::after, kAfter>(rule, text, name);
    }
}

constexpr auto forMatch = forOne<Kind::Match>;

constexpr std::array<Field, kFieldCount> kFields{{
    {"host", forAll, plainText<&Rule::host>, setNames<&Rule::host>},
    {"not-host", forAll, plainText<&Rule::notHost>, setNames<&Rule::notHost>},
    {"program", forMatch, plainText<&Rule::program>, setNames<&Rule::program>},
    {"not-program", forMatch, plainText<&Rule::notProgram>, setNames<&Rule::notProgram>},
    {"facility", forMatch, plainText<&Rule::facility>, setNames<&Rule::facility>},
    {"not-facility", forMatch, plainText<&Rule::notFacility>, setNames<&Rule::notFacility>},
    {"level", forMatch, levelText, setLevel},
    {"keyword", forMatch, plainText<&Rule::keyword>, setText<&Rule::keyword>},
    {"not-keyword", forMatch, plainText<&Rule::notKeyword>, setText<&Rule::notKeyword>},
    {"glob", forMatch, plainText<&Rule::glob>, setGlob},
    {"ignore-case", forMatch, caseText, setCase},
    {"count", forMatch, numberText<&Rule::count>, setNumber<&Rule::count, kCounts>},
    {"within", forMatch, spanText<&Rule::within>, setSpan<&Rule::within, kWithin>},
    {"after", forOne<Kind::Silent>, afterText, setAfter},
    {"factor", forOne<Kind::Rate>, numberText<&Rule::factor>, setNumber<&Rule::factor, kFactors>},
    {"interval", forAll, spanText<&Rule::interval>, setSpan<&Rule::interval, kIntervals>},
}};

bool hasCondition(const Rule& rule) {
    return std::any_of(kFields.begin(), kFields.end(), [&rule](const Field& field) {
        const std::string key = field.key;
        const bool condition = key != "count" && key != "within" && key != "interval" && key != "ignore-case";
        return condition && !field.text(rule).empty();
    });
}

void checkMatch(const Rule& rule) {
    if (!hasCondition(rule)) {
        throw Failure("rule '" + rule.name +
                      "' has nothing to look for; give --level, --eps or --keyword, or --host, "
                      "--program, --facility or --glob");
    }
    if ((rule.count > 1) != (rule.within > 0)) {
        throw Failure("rule '" + rule.name + "' needs both --count and --within, or none: --count 10 --within 5m");
    }
}

}  // namespace

const std::array<Field, kFieldCount>& Fields() {
    return kFields;
}

const Field* FieldOf(Kind kind, const std::string& key) {
    const auto* found = std::find_if(kFields.begin(), kFields.end(),
                                     [&](const Field& field) { return key == field.key && field.isFor(kind); });
    return found == kFields.end() ? nullptr : found;
}

void CheckComplete(const Rule& rule) {
    if (rule.kind == Kind::Match) {
        checkMatch(rule);
    } else if (rule.kind == Kind::Silent && rule.after < 0) {
        throw Failure("rule '" + rule.name + "' does not say after what time; give --after 30m, or --after auto");
    } else if (rule.kind == Kind::Rate && rule.factor < 0) {
        throw Failure("rule '" + rule.name + "' does not say how much is too much; give --factor 10");
    }
}

void CheckName(const std::string& name) {
    constexpr size_t kMostBytes = 100;
    const bool hidden = std::any_of(name.begin(), name.end(),
                                    [](char c) { return static_cast<unsigned char>(c) < ' ' || c == '\x7f'; });
    if (name.empty() || name.size() > kMostBytes || name.front() == ' ' || name.back() == ' ' || hidden ||
        name.find_first_of("[]\"#;=") != std::string::npos || !IsUtf8(name)) {
        throw Failure("the name '" + name + "' cannot be used; give letters, digits and single blanks");
    }
}

int ParseLevel(const std::string& text, const std::string& name) {
    const std::list<std::string> levels = store::LevelsOf({text}, name);
    if (levels.empty() || text.find(',') != std::string::npos) {
        throw Failure(name + ": not one level: '" + text +
                      "'; give one, such as err: it stands for the worse ones, too");
    }
    return PriorStrToType(levels.back().c_str());
}

std::string Describe(const Rule& rule) {
    std::string text;
    for (const Field& field : kFields) {
        const std::string value = field.text(rule);
        if (!value.empty()) {
            text.append(text.empty() ? "" : "; ").append(field.key).append(" ").append(value);
        }
    }
    return text;
}

std::string SpanText(int64_t seconds) {
    constexpr std::pair<int64_t, const char*> kUnits[] = {{604800, "w"}, {86400, "d"}, {3600, "h"}, {60, "m"}};
    for (const auto& [size, unit] : kUnits) {
        if (seconds != 0 && seconds % size == 0) {
            return std::to_string(seconds / size) + unit;
        }
    }
    return std::to_string(seconds) + "s";
}

int64_t IntervalOf(const Rule& rule) {
    constexpr int64_t kOfMatches = 60;
    constexpr int64_t kOfDevices = 300;
    return rule.interval >= 0 ? rule.interval : rule.kind == Kind::Match ? kOfMatches : kOfDevices;
}

}  // namespace quor::rules
