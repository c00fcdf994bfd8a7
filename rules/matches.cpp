#include "rules/matches.h"

#include <algorithm>
#include <utility>

namespace quor::rules {
namespace {

constexpr size_t kMostSeconds = 262144;  // of all rules

char smallLetter(char c) {
    return c >= 'A' && c <= 'Z' ? static_cast<char>(c + 32) : c;
}

void makeSmall(std::string& text) {
    std::transform(text.begin(), text.end(), text.begin(), smallLetter);
}

std::string inCase(std::string text, bool small) {
    if (small) {
        makeSmall(text);
    }
    return text;
}

bool isCounted(const Rule& rule) {
    return rule.kind == Kind::Match && rule.enabled && rule.count > 1;
}

}  // namespace

bool Subject::holds(const std::string& text, bool small) const {
    if (!small) {
        return record_.msg.find(text) != std::string::npos || record_.msgid.find(text) != std::string::npos ||
               record_.sdata.find(text) != std::string::npos;
    }
    if (small_.empty()) {
        small_.append(record_.msg).append("\n").append(record_.msgid).append("\n").append(record_.sdata);
        makeSmall(small_);
    }
    return small_.find(text) != std::string::npos;
}

Matcher::Matcher(const Rule& rule)
    : hosts_(rule.host, rule.notHost), programs_(rule.program, rule.notProgram),
      facilities_(rule.facility, rule.notFacility), level_(rule.level), small_(rule.ignoreCase),
      keyword_(inCase(rule.keyword, small_)), notKeyword_(inCase(rule.notKeyword, small_)), glob_(rule.glob) {}

// What costs least is asked first.
bool Matcher::matches(const Subject& subject) const {
    const store::Record& record = subject.record();
    return (level_ < 0 || record.prio <= level_) && facilities_.takes(record.fac) && programs_.takes(record.prog) &&
           hosts_.takes(record.host) && (keyword_.empty() || subject.holds(keyword_, small_)) &&
           (glob_.empty() || MatchesGlob(glob_, record.msg)) &&
           (notKeyword_.empty() || !subject.holds(notKeyword_, small_));
}

void Matches::setRules(const std::vector<Rule>& rules) {
    const auto counted = static_cast<size_t>(std::count_if(rules.begin(), rules.end(), isCounted));
    std::vector<Watched> former = std::exchange(watched_, {});
    for (const Rule& rule : rules) {
        if (rule.kind != Kind::Match || !rule.enabled) {
            continue;
        }
        watched_.push_back({rule, Matcher(rule), nullptr});
        if (!isCounted(rule)) {
            continue;
        }
        const auto same = std::find_if(former.begin(), former.end(), [&rule](const Watched& one) {
            return one.windows && one.rule.name == rule.name && Describe(one.rule) == Describe(rule);
        });
        watched_.back().windows = same != former.end()
                                      ? std::move(same->windows)
                                      : std::make_unique<Windows>(rule.count, rule.within, kMostSeconds / counted);
    }
}

const std::vector<const Rule*>& Matches::take(const store::Record& record, const std::string& device, int64_t second) {
    const Subject subject(record);
    fired_.clear();
    for (Watched& watched : watched_) {
        if (watched.matcher.matches(subject) && (!watched.windows || watched.windows->add(device, second))) {
            fired_.push_back(&watched.rule);
        }
    }
    return fired_;
}

}  // namespace quor::rules
