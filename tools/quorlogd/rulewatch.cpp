#include "tools/quorlogd/rulewatch.h"

#include <syslog.h>

#include <algorithm>
#include <array>
#include <map>
#include <utility>

#include "base/numbers.h"
#include "base/paths.h"
#include "base/textfile.h"
#include "common.h"
#include "rules/rulefile.h"
#include "store/failure.h"
#include "tools/quorlogd/announce.h"
#include "tools/quorlogd/noticetext.h"

namespace quor {
namespace {

using rules::Report;
using std::chrono::seconds;

constexpr size_t kMostStateBytes = size_t{64} << 20U;
constexpr seconds kLook{5};
constexpr seconds kSave{300};
constexpr seconds kPause{5};  // a longer one between two ticks was a stop of this process, in which nobody listened
constexpr char kFailedMail[] =
    "Failed to send email.";  // a notice about it would fail as well, and be logged, and so on

std::string kindOf(const rules::Rule& rule) {
    return "rule " + rule.name;
}

struct Wording {
    const char* tag;
    const char* one;
    const char* many;
};

const Wording& wordingOf(Report::What what) {
    static constexpr std::array<Wording, 4> kWordings{{
        {"QUORSYSLOG_DEVICE_SILENT", "nothing is heard any more of", "nothing is heard any more of"},
        {"QUORSYSLOG_DEVICE_BACK", "is heard again:", "are heard again:"},
        {"QUORSYSLOG_DEVICE_LOUD", "sends far more than it usually does:", "send far more than they usually do:"},
        {"QUORSYSLOG_DEVICE_NEW", "was heard for the first time:", "were heard for the first time:"},
    }};
    return kWordings[static_cast<size_t>(what)];
}

}  // namespace

RuleWatch::RuleWatch(const Options& options, Alarms& alarms) : alarms_(alarms), devices_(options.maxDevices) {
    ticked_ = nextLook_ = Clock::now();
    nextSave_ = ticked_ + kSave;
}

// Once; what is known since is newer.
void RuleWatch::load() {
    if (std::exchange(loaded_, true)) {
        return;
    }
    std::string text;
    const ReadOutcome outcome = ReadTextFile(paths::kRulesState, kMostStateBytes, text);
    if (outcome == ReadOutcome::Failed || (outcome == ReadOutcome::Done && !devices_.load(text))) {
        syslog(LOG_WARNING, "What is known of the devices cannot be read from %s: it begins anew", paths::kRulesState);
    }
}

void RuleWatch::save(bool clean) {
    nextSave_ = Clock::now() + kSave;
    const bool kept = ReplaceTextFile(paths::kRulesState, devices_.save(clean));
    if (!kept && !complained_) {
        syslog(LOG_WARNING, "What is known of the devices cannot be written to %s: a restart will forget it",
               paths::kRulesState);
    }
    complained_ = !kept;
}

void RuleWatch::apply(const std::vector<rules::Rule>& all, AccountingManager& counted) {
    const bool devices = std::any_of(all.begin(), all.end(), [](const rules::Rule& rule) {
        return rule.enabled && rule.kind != rules::Kind::Match;
    });
    const bool before = !devices_.empty();
    if (devices && !before) {
        load();
        for (const QUORLOG_LOG_DEVICE_STATISTIC& row : counted.HistogramGet()) {
            devices_.know(row.device);
        }
    }
    matches_.setRules(all);
    devices_.setRules(all);
    for (const rules::Rule& rule : all) {
        alarms_.setInterval(kindOf(rule), static_cast<int32_t>(rules::IntervalOf(rule)));
    }
    if (devices || before) {
        save(false);
    }
}

void RuleWatch::reload(AccountingManager& counted) {
    try {
        apply(rules::LoadRules(paths::kRules), counted);
    } catch (const store::Failure& failure) {
        syslog(LOG_ERR, "%s; the rules of before stay in force", failure.what());
        RecordEvent(std::string("The rules cannot be read, those of before stay in force: ") + failure.what());
    }
}

void RuleWatch::hear(const store::Record& record, const std::string& device, int64_t second) {
    if (devices_.empty()) {
        return;
    }
    if (device == record.host || devices_.isNamed(record.host)) {
        devices_.hear(record.host, second);
    } else {
        devices_.hearOther(second);
    }
}

bool RuleWatch::match(const store::Record& record, const std::string& device, int64_t second) {
    constexpr size_t kAddressBytes = 64;
    if (matches_.empty()) {
        return false;
    }
    bool announced = false;
    const std::string& counted = device == record.host ? device : record.ip.substr(0, kAddressBytes);
    for (const rules::Rule* rule : matches_.take(record, counted, second)) {
        if (alarms_.grant(kindOf(*rule), device, Clock::now())) {
            announced = true;
            announce(*rule, record);
        }
    }
    return announced;
}

void RuleWatch::announce(const rules::Rule& rule, const store::Record& record) {
    const std::string content = ContentOf(record, rule.keyword);
    const std::string times =
        rule.count > 1 ? std::to_string(rule.count) + " logs within " + rules::SpanText(rule.within) : "";
    RecordEvent("Rule " + rule.name + (times.empty() ? "" : ", " + times) + ". Log content: [" + record.host + ": " +
                content + "]");
    std::array<char, 2048> escaped{};
    if (content.find(kFailedMail) != std::string::npos ||
        EncodeJson(content.c_str(), escaped.data(), static_cast<int>(escaped.size())) < 0) {
        return;
    }
    std::map<std::string, std::string> values = {
        {"%RULE%", rule.name}, {"%HOST%", record.host}, {"%SYSLOG_CONTENT%", escaped.data()}};
    if (!times.empty()) {
        values["%TIMES%"] = times;
    }
    SendNotice("QUORSYSLOG_RULE_MATCH", values);
}

// What was told is kept before it is told: a crash between the two tells it never, not twice.
void RuleWatch::announce(const std::vector<Report>& reports) {
    if (reports.empty()) {
        return;
    }
    save(false);
    for (const Report& report : reports) {
        const Wording& wording = wordingOf(report.what);
        RecordEvent("Rule " + report.rule + ": " + (report.count > 1 ? wording.many : wording.one) + " " +
                    report.devices);
        SendNotice(wording.tag,
                   {{"%RULE%", report.rule}, {"%COUNT%", Decimal(report.count)}, {"%DEVICES%", report.devices}});
    }
}

void RuleWatch::tick(bool reading) {
    const Clock::time_point now = Clock::now();
    const auto passed = std::min<Clock::duration>(now - ticked_, kPause);
    ticked_ = now;
    if (devices_.empty() || !reading) {
        return;
    }
    devices_.elapse(std::chrono::duration<double>(passed).count());
    if (now >= nextLook_) {
        nextLook_ = now + kLook;
        devices_.judge();
        announce(devices_.takeReports(now));
    }
    if (now >= nextSave_) {
        save(false);
    }
}

void RuleWatch::finish() {
    if (!devices_.empty()) {
        announce(devices_.takeReports(Clock::now(), true));
        save(true);
    }
}

}  // namespace quor
