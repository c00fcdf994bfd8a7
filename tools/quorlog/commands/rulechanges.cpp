// rules set, silent, rate, newdevice: a rule is added or changed.
#include <algorithm>
#include <map>

#include "base/paths.h"
#include "rules/rulefile.h"
#include "tools/quorlog/commands/rulecommands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/rulefiles.h"

namespace quor::cli {
namespace {

using RuleKind = rules::Kind;

struct ChangeOptions {
    std::string name;
    std::map<std::string, std::string> given;  // by the key of the rule's field
    uint64_t eps = 0;
    bool disable = false;
};

// How the fields of a rule are given, by their keys.
struct FieldOption {
    const char* key;
    const char* type;
    const char* help;
};
constexpr FieldOption kFieldOptions[] = {
    {"host", "NAMES", "Logs of these hosts; * and ? stand for any text"},
    {"not-host", "NAMES", "Of any host but these"},
    {"program", "NAMES", "Logs of these programs; * and ? stand for any text"},
    {"not-program", "NAMES", "Of any program but these"},
    {"facility", "NAMES", "Logs of these facilities"},
    {"not-facility", "NAMES", "Of any facility but these"},
    {"level", "NAME", "Logs of this level or worse"},
    {"keyword", "TEXT", "Messages that contain the text"},
    {"not-keyword", "TEXT", "Messages without the text"},
    {"glob", "PATTERN", "Messages like this as a whole; * is any text, ? any character"},
    {"count", "NUMBER", "Only when one host sends so many of them ..."},
    {"within", "SPAN", "... in this time: 90s, 5m, 2h"},
    {"after", "SPAN", "Time without a message: 30m, 6h, 2d; auto: by what is usual for the device"},
    {"factor", "NUMBER", "So many times what is usual for the device; 10 by default"},
    {"interval", "SPAN", "Least time between two notices; by default 1m, 5m for devices"},
};

void addField(CLI::App& command, const FieldOption& field, std::map<std::string, std::string>& given) {
    const std::string key = field.key;
    const bool list = std::string(field.type) == "NAMES";
    const auto take = [&given, key](const std::vector<std::string>& values) {
        for (const std::string& value : values) {
            if (value.empty()) {
                throw Failure("--" + key + ": the value is empty; leave the option out, or give one");
            }
            std::string& text = given[key];
            text += (text.empty() ? "" : ",") + value;
        }
        return true;
    };
    CLI::Option* option = command.add_option("--" + key, take, field.help)->type_name(field.type);
    option->multi_option_policy(list ? CLI::MultiOptionPolicy::TakeAll : CLI::MultiOptionPolicy::Throw);
}

template <RuleKind Wanted>
void setup(CLI::App& command, ChangeOptions& options) {
    command.add_option("name", options.name, "Name of the rule, which may be new")->type_name("NAME")->required();
    for (const FieldOption& field : kFieldOptions) {
        if (rules::FieldOf(Wanted, field.key) != nullptr) {
            addField(command, field, options.given);
        }
    }
    if (Wanted == RuleKind::Match) {
        command.add_flag_callback(
            "-i,--ignore-case", [&options] { options.given["ignore-case"] = "yes"; },
            "Keywords in small or capital letters (ASCII)");
        AddNumberOption(command, "--eps", options.eps, "Notify of samples with this many logs or more");
    }
    command.add_flag("--disable", options.disable, "Keep the rule, but do not check it");
}

void tell(const std::string& name, const std::string& type, const std::string& threshold, bool enabled) {
    const std::string what = name + ": " + type + (threshold.empty() ? "" : " " + threshold);
    WriteLine("set rule " + what + (enabled ? "" : ", disabled"));
    RecordDeed("Set rule " + what + (enabled ? "" : ", disabled"));
}

// ---- rules.conf

int runRule(const ChangeOptions& options, RuleKind kind) {
    const RulesLock alone;
    CheckRuleName(options.name);
    if (IsNotifyRule(options.name)) {
        throw Failure("rule '" + options.name +
                      "' is one of --level, --eps or --keyword alone; give another name, or " + "delete it first");
    }
    rules::Rule rule;
    rule.name = options.name;
    rule.kind = kind;
    rule = FindRule(options.name).value_or(rule);
    if (rule.kind != kind) {
        throw Failure("rule '" + options.name + "' is of kind " + rules::kKindNames[static_cast<size_t>(rule.kind)] +
                      "; give another name, or delete it first");
    }
    if (options.eps != 0) {
        throw Failure("--eps: rule '" + options.name + "' is not for the rate of all logs; give another name");
    }
    for (const auto& [key, text] : options.given) {
        rules::FieldOf(kind, key)->set(rule, text, "--" + key);
    }
    rule.factor = kind == RuleKind::Rate && rule.factor < 0 ? 10 : rule.factor;
    rule.enabled = !options.disable;
    rules::CheckComplete(rule);
    rules::SaveRule(paths::kRules, rule.name, rule);
    tell(rule.name, rules::kKindNames[static_cast<size_t>(kind)], rules::Describe(rule), rule.enabled);
    PutInForce(rule.enabled ? "checks by it" : "leaves it out");
    WarnOfNoChannel();
    return kDone;
}

template <RuleKind Wanted>
int run(const ChangeOptions& options) {
    return runRule(options, Wanted);
}

// ---- notify.conf

bool isPlain(const ChangeOptions& options) {
    const bool alone =
        options.given.empty() ||
        (options.given.size() == 1 && (options.given.count("level") != 0 || options.given.count("keyword") != 0));
    return alone && !FindRule(options.name);
}

// The file has no way to write these.
void checkTexts(const ChangeOptions& options) {
    CheckRuleName(options.name);
    const auto keyword = options.given.find("keyword");
    if (keyword != options.given.end() && keyword->second.find_first_of("\r\n") != std::string::npos) {
        throw Failure("--keyword: a rule holds one line; give a text without line breaks");
    }
    if (options.eps > INT64_MAX) {
        throw Failure("--eps: too large; give fewer digits");
    }
}

// What was given decides the type; a known rule keeps the rest.
void apply(const ChangeOptions& options, NotifyRule& rule) {
    rule.name = options.name;
    rule.notify_enable = !options.disable;
    if (options.eps != 0) {
        rule.notify_type = kEps;
        rule.notify_eps = static_cast<int64_t>(options.eps);
    }
    for (const auto& [key, text] : options.given) {
        rule.notify_type = key == "level" ? kSeverity : kKeyword;
        if (key == "level") {
            rules::Rule parsed;
            rules::FieldOf(RuleKind::Match, key)->set(parsed, text, "--level");
            rule.notify_pri = static_cast<_SYSLOG_DB_PRIORITY_tag>(parsed.level);
        } else {
            rule.notify_pat = text;
        }
    }
}

// No rule behind one that lacks a key is loaded.
bool isLoaded(const std::string& name) {
    for (const std::string& earlier : NotifyRuleNames()) {
        if (earlier == name) {
            return true;
        }
        if (!LoadNotifyRule(earlier)) {
            Complain("rule '" + earlier + "' lacks a key, and no rule after it is loaded; repair it first");
            return false;
        }
    }
    return true;
}

int runPlain(const ChangeOptions& options) {
    const RulesLock alone;
    checkTexts(options);
    const std::optional<NotifyRule> known = IsNotifyRule(options.name) ? LoadNotifyRule(options.name) : std::nullopt;
    if (!known && options.given.empty() && options.eps == 0) {
        rules::Rule nothing;
        nothing.name = options.name;
        rules::CheckComplete(nothing);
    }
    NotifyRule rule = known.value_or(NotifyRule());
    apply(options, rule);
    SaveNotifyRule(rule);
    tell(rule.name, TypeOf(rule), ThresholdOf(rule), rule.notify_enable);
    if (isLoaded(rule.name)) {
        PutInForce(rule.notify_enable ? "checks by it" : "leaves it out");
        WarnOfNoChannel();
    }
    return kDone;
}

int runSet(const ChangeOptions& options) {
    if (options.eps != 0 && !options.given.empty()) {
        throw Failure("--eps: a rule for the rate of all logs; leave out --" + options.given.begin()->first);
    }
    return isPlain(options) ? runPlain(options) : runRule(options, RuleKind::Match);
}

}  // namespace

void AddRuleChanges(CLI::App& parent, int& status) {
    AddCommand<ChangeOptions>(parent, "set", "Add or change a rule for logs", status, setup<RuleKind::Match>, runSet);
    AddCommand<ChangeOptions>(parent, "silent", "Add or change a rule for devices that go silent", status,
                              setup<RuleKind::Silent>, run<RuleKind::Silent>);
    AddCommand<ChangeOptions>(parent, "rate", "Add or change a rule for devices that send far more than usual", status,
                              setup<RuleKind::Rate>, run<RuleKind::Rate>);
    AddCommand<ChangeOptions>(parent, "newdevice", "Add or change a rule for devices that were never heard before",
                              status, setup<RuleKind::NewDevice>, run<RuleKind::NewDevice>);
}

}  // namespace quor::cli
