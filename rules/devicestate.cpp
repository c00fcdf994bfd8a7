// The state of the rules about devices, as text: a line for each fact, words with blanks between them, names with the
// bytes escaped that a word cannot hold.
#include <algorithm>
#include <array>
#include <cmath>
#include <optional>

#include "base/json.h"
#include "base/numbers.h"
#include "base/words.h"
#include "rules/devicewatch.h"

namespace quor::rules {
namespace {

constexpr const char kHead[] = "quorlogd-rules 1";
constexpr double kFraction = 1000;    // what is kept of the doubles
constexpr int64_t kSavedEvery = 300;  // seconds that an unclean state may be old
constexpr int64_t kMostNumber = int64_t{1} << 53;

using Line = std::vector<std::string>;

std::string escaped(const std::string& name) {
    std::string text = "=";  // so that no name is an empty word
    for (const char c : name) {
        if (static_cast<unsigned char>(c) <= ' ' || c == '%' || c == '\x7f') {
            text += '%';
            AppendHex(text, static_cast<unsigned char>(c), 2);
        } else {
            text += c;
        }
    }
    return text;
}

int hexDigit(char c) {
    constexpr std::string_view kDigits = "0123456789abcdef";
    const size_t found = kDigits.find(c);
    return found == std::string_view::npos ? 0 : static_cast<int>(found);
}

std::string unescaped(const std::string& text) {
    std::string name;
    for (size_t i = 1; i < text.size(); ++i) {
        if (text[i] == '%' && i + 2 < text.size()) {
            name += static_cast<char>(hexDigit(text[i + 1]) * 16 + hexDigit(text[i + 2]));
            i += 2;
        } else {
            name += text[i];
        }
    }
    return name;
}

void addNumber(std::string& text, int64_t value) {
    text.append(" ").append(std::to_string(value));
}

void addFraction(std::string& text, double value) {
    addNumber(text, std::llround(value * kFraction));
}

int64_t number(const Line& line, size_t at) {
    return std::clamp(ToInt64(line[at].c_str()), int64_t{-1}, kMostNumber);
}

double fraction(const Line& line, size_t at) {
    return static_cast<double>(std::max(number(line, at), int64_t{0})) / kFraction;
}

std::string lineOf(const std::string& device, const Pulse::State& state) {
    std::string text = "device";
    for (const int64_t value : {state.first, state.last, state.second, state.minutes, state.logs}) {
        addNumber(text, value);
    }
    for (const double value : {state.longest, state.mean, state.most}) {
        addFraction(text, value);
    }
    return text + " " + escaped(device) + "\n";
}

constexpr size_t kDeviceWords = 10;

// A device that was heard after the state was written is not late by that.
Pulse::State stateOf(const Line& line, int64_t now, bool clean) {
    Pulse::State state;
    state.first = std::min(number(line, 1), now);
    state.last = std::min(number(line, 2) + (clean ? 0 : kSavedEvery), now);
    state.second = number(line, 3);
    state.minutes = number(line, 4);
    state.logs = number(line, 5);
    state.longest = fraction(line, 6);
    state.mean = fraction(line, 7);
    state.most = fraction(line, 8);
    return state;
}

}  // namespace

std::string DeviceWatch::save(bool clean) const {
    std::string text = std::string(kHead) + (clean ? " clean\n" : " unclean\n") + "clock";
    addNumber(text, clock_.state().now);
    addNumber(text, clock_.state().newest);
    addFraction(text, clock_.state().usual);
    text += '\n';
    for (const auto& [device, pulse] : devices_) {
        if (pulse.wasHeard()) {
            text += lineOf(device, pulse.state());
        }
    }
    for (const Watched& watched : watched_) {
        text += "rule " + std::to_string(static_cast<int>(watched.rule.kind));
        addNumber(text, watched.since);
        text += " " + escaped(watched.rule.name) + " " + escaped(watched.allTold ? watched.all : "") + "\n";
        for (const auto& [device, note] : watched.raised) {
            text += note.told ? "told " + escaped(device) + "\n" : "";
        }
        for (const std::string& device : watched.ended) {
            text += "told " + escaped(device) + "\n";
        }
    }
    return text;
}

bool DeviceWatch::load(const std::string& text) {
    DeviceWatch read(limit_);
    std::optional<bool> clean;
    bool good = true;
    EachWord(text, "\n", [&](std::string_view row) {
        Line line;
        EachWord(row, " ", [&line](std::string_view word) { line.emplace_back(word); });
        const std::string& first = line.empty() ? "" : line.front();
        if (!clean) {
            clean = row == std::string(kHead) + " clean";
            good = *clean || row == std::string(kHead) + " unclean";
        } else if (first == "clock" && line.size() == 4) {
            read.clock_.restore({number(line, 1), number(line, 2), fraction(line, 3)});
        } else if (first == "device" && line.size() == kDeviceWords) {
            read.restore(unescaped(line.back()), stateOf(line, read.clock_.ofLogs(), *clean));
        } else if (first == "rule" && line.size() == 5) {
            good = good && read.restoreRule(number(line, 1), number(line, 2), unescaped(line[3]), unescaped(line[4]));
        } else if (first == "told" && line.size() == 2 && !read.watched_.empty()) {
            read.watched_.back().raised[unescaped(line[1])].told = true;
        } else {
            good = false;
        }
    });
    if (good && clean) {
        *this = std::move(read);
    }
    return good && clean;
}

void DeviceWatch::restore(const std::string& device, const Pulse::State& state) {
    if (devices_.size() < limit_) {
        devices_[device].restore(state);
    }
}

bool DeviceWatch::restoreRule(int64_t kind, int64_t since, const std::string& name, const std::string& all) {
    if (kind < 0 || static_cast<size_t>(kind) >= kKindNames.size()) {
        return false;
    }
    Rule rule;
    rule.name = name;
    rule.kind = static_cast<Kind>(kind);
    Watched watched(rule, std::min(since, clock_.ofLogs()));
    watched.all = all;
    watched.allTold = !all.empty();
    watched_.push_back(std::move(watched));
    return true;
}

}  // namespace quor::rules
