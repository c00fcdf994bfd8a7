#include "store/names.h"

#include <algorithm>
#include <iterator>

#include "dbutil.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr const char* kAny = "any";
constexpr const char* kEscapedComma = "\\,";

std::list<std::string> split(const std::string& text) {
    std::list<std::string> names(1);
    for (size_t at = 0; at < text.size(); ++at) {
        if (text[at] == ',') {
            names.emplace_back();
        } else {
            at += text.compare(at, 2, kEscapedComma) == 0 ? 1 : 0;
            names.back() += text[at];
        }
    }
    return names;
}

void check(const std::list<std::string>& names, const std::string& option, const std::string& given) {
    if (names.size() > 1 && std::find(names.begin(), names.end(), kAny) != names.end()) {
        throw Failure(option + ": 'any' means every name; give it alone or leave it out");
    }
    if (std::find(names.begin(), names.end(), "") != names.end()) {
        throw Failure(option + ": empty name in '" + given +
                      "'; separate names with one comma, and write a comma of a name as \\,");
    }
}

// The names that other programs and people use, and the numbers; past the last one when there is no such level.
size_t levelIndex(std::string name) {
    constexpr std::pair<const char*, size_t> kOthers[] = {{"emergency", 0},    {"panic", 0}, {"critical", 2},
                                                          {"error", 3},        {"warn", 4},  {"information", 6},
                                                          {"informational", 6}};
    std::transform(name.begin(), name.end(), name.begin(),
                   [](char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c; });
    if (name.size() == 1 && name[0] >= '0' && name[0] <= '7') {
        return static_cast<size_t>(name[0] - '0');
    }
    for (const auto& [other, level] : kOthers) {
        if (name == other) {
            return level;
        }
    }
    const auto* found = std::find(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), name);
    return static_cast<size_t>(found - std::begin(g_MappingSyslogPrior));
}

[[noreturn]] void failLevel(const std::string& option, const std::string& name) {
    std::string names;
    for (const char* known : g_MappingSyslogPrior) {
        names += names.empty() ? known : std::string(", ") + known;
    }
    throw Failure(option + ": no such level '" + name + "'; give " + names +
                  ", a number from 0 to 7, or err+ for err and worse");
}

}  // namespace

std::list<std::string> NamesOf(const Names& lists, const std::string& option, bool whole) {
    std::list<std::string> all;
    for (const std::string& text : lists) {
        std::list<std::string> names = split(text);
        check(names, option, text);
        if (whole && names.size() > 1 && text.find(kEscapedComma) == std::string::npos) {
            names.push_back(text);
        }
        all.splice(all.end(), names);
    }
    check(all, option, InWords(lists));
    if (all == std::list<std::string>{kAny}) {
        all.clear();
    }
    return all;
}

std::list<std::string> LevelsOf(const Names& lists, const std::string& option) {
    std::list<std::string> levels;
    for (const std::string& name : NamesOf(lists, option, false)) {
        const bool orWorse = name.back() == '+';
        const size_t last = levelIndex(orWorse ? name.substr(0, name.size() - 1) : name);
        if (last == std::size(g_MappingSyslogPrior)) {
            failLevel(option, name);
        }
        for (size_t level = orWorse ? 0 : last; level <= last; ++level) {
            levels.emplace_back(g_MappingSyslogPrior[level]);
        }
    }
    return levels;
}

std::list<std::string> OtherLevels(const std::list<std::string>& levels) {
    std::list<std::string> others;
    std::copy_if(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior), std::back_inserter(others),
                 [&](const char* level) { return std::find(levels.begin(), levels.end(), level) == levels.end(); });
    return others;
}

std::string InWords(const Names& lists) {
    std::string words;
    for (const std::string& text : lists) {
        words += (words.empty() ? "" : ",") + text;
    }
    return words;
}

}  // namespace quor::store
