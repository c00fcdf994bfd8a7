// rules list, set, test: the notification rules.
#include <algorithm>
#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>

#include "base/paths.h"
#include "common/handles.h"
#include "notification.h"
#include "store/receiving.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

using Rule = _SYSLOG_NOTIFY_RULES_tag;

enum RuleType : int32_t { kSeverity = 0, kEps = 1, kKeyword = 2 };
constexpr std::array<const char*, 3> kTypeNames = {"severity", "eps", "keyword"};

const std::string kFile = paths::kNotifyRules;

std::vector<std::string> ruleNames() {
    StringList list(QLIBCSzListAlloc(16));
    std::vector<std::string> names;
    if (QLIBCFileExist(paths::kNotifyRules) == 1 && QLIBCFileEnumSection(paths::kNotifyRules, Adopt(list)) < 0) {
        throw Failure("cannot read " + kFile + "; make sure that you may", store::Cause::Denied);
    }
    names.assign(list->items, list->items + list->count);
    return names;
}

std::string threshold(const Rule& rule) {
    switch (rule.notify_type) {
    case kSeverity:
        return PriorTypeToStr(rule.notify_pri);
    case kEps:
        return std::to_string(rule.notify_eps);
    case kKeyword:
        return rule.notify_pat;
    default:
        return "";
    }
}

std::string typeName(const Rule& rule) {
    const auto type = static_cast<size_t>(rule.notify_type);
    return type < kTypeNames.size() ? kTypeNames[type] : "never checked";
}

void setupList(CLI::App& command, OutputOptions& output) {
    AddOutputOptions(command, output);
}

int runList(const OutputOptions& options) {
    std::string bad;
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.style(), {{"name"}, {"type"}, {"threshold"}, {"enabled"}}, out);
    const std::vector<std::string> names = ruleNames();
    for (const std::string& name : names) {
        Rule rule;
        if (SyslogNotifyConfGet(kFile, name, rule) < 0) {
            bad = bad.empty() ? name : bad;
            continue;
        }
        sink->row({rule.name, typeName(rule), threshold(rule), rule.notify_enable ? "yes" : "no"});
    }
    sink->finish();
    if (!bad.empty()) {
        throw Failure("rule '" + bad + "' of " + kFile +
                      " lacks a key, and no rule after it is loaded; "
                      "repair it with quorlog rules set");
    }
    return names.empty() ? ReportNothing("no rules are set") : kDone;
}

struct SetOptions {
    std::string name;
    std::string level;
    std::string keyword;
    uint64_t eps = 0;
    bool disable = false;
};

CLI::Option* addLevel(CLI::App& command, std::string& level, const std::string& help) {
    const std::vector<std::string> names(std::begin(g_MappingSyslogPrior), std::end(g_MappingSyslogPrior));
    return command.add_option("--level", level, help)->type_name("NAME")->check(CLI::IsMember(names));
}

void setupSet(CLI::App& command, SetOptions& options) {
    command.add_option("name", options.name, "Name of the rule, which may be new")->type_name("NAME")->required();
    CLI::Option* level = addLevel(command, options.level, "Notify of logs of this level or worse");
    CLI::Option* keyword =
        command.add_option("--keyword", options.keyword, "Notify of messages that contain the text")->type_name("TEXT");
    AddNumberOption(command, "--eps", options.eps, "Notify of samples with this many logs or more")
        ->excludes(level)
        ->excludes(keyword);
    keyword->excludes(level);
    command.add_flag("--disable", options.disable, "Keep the rule, but do not check it");
}

// The file has no way to write these; elsewhere in a name they would end it or begin a comment.
void checkTexts(const SetOptions& options) {
    const std::string& name = options.name;
    const bool odd = name.empty() || name.front() == ' ' || name.back() == ' ' ||
                     name.find_first_of("[]\"#;=") != std::string::npos || Visible(name) != name;
    if (odd) {
        throw Failure("the name '" + name + "' cannot be used; give letters, digits and single blanks");
    }
    if (options.keyword.find_first_of("\r\n") != std::string::npos) {
        throw Failure("--keyword: a rule holds one line; give a text without line breaks");
    }
    if (options.eps > INT64_MAX) {
        throw Failure("--eps: too large; give fewer digits");
    }
}

// What was given decides the type; a known rule keeps the rest.
void apply(const SetOptions& options, Rule& rule) {
    rule.name = options.name;
    rule.notify_enable = !options.disable;
    if (!options.level.empty()) {
        rule.notify_type = kSeverity;
        rule.notify_pri = PriorStrToType(options.level.c_str());
    } else if (options.eps != 0) {
        rule.notify_type = kEps;
        rule.notify_eps = static_cast<int64_t>(options.eps);
    } else if (!options.keyword.empty()) {
        rule.notify_type = kKeyword;
        rule.notify_pat = options.keyword;
    }
}

// A rule that nobody checks, or whose notices reach nobody, should not be a surprise later.
void putInForce(const Rule& rule) {
    for (const std::string& name : ruleNames()) {
        Rule earlier;
        if (name == rule.name) {
            break;
        }
        if (SyslogNotifyConfGet(kFile, name, earlier) < 0) {
            Complain("rule '" + name + "' lacks a key, and no rule after it is loaded; repair it first");
            return;
        }
    }
    const int process = store::FollowerProcess();
    if (process == 0) {
        Complain("quorlogd does not run; it reads the rules when it starts");
    } else if (kill(process, SIGHUP) != 0) {
        Complain(std::string("quorlogd could not be told: ") + strerror(errno) + "; run: systemctl reload quorlogd");
    } else {
        WriteLine(rule.notify_enable ? "quorlogd checks by it from now on" : "quorlogd leaves it out from now on");
    }
    if (!IsNotificationSet()) {
        Complain(std::string("matches become events only: no channel for notices is set up in ") +
                 paths::kSystemSettings);
    }
}

int runSet(const SetOptions& options) {
    checkTexts(options);
    const std::vector<std::string> names = ruleNames();
    const bool known = std::find(names.begin(), names.end(), options.name) != names.end();
    const bool complete = !options.level.empty() || options.eps != 0 || !options.keyword.empty();
    Rule rule;
    const bool kept = known && SyslogNotifyConfGet(kFile, options.name, rule) == 0;
    if (!kept && !complete) {
        throw Failure("rule '" + options.name + "' has nothing to look for; give --level, --eps or --keyword");
    }
    apply(options, rule);
    if (SyslogNotifyConfSet(kFile, options.name, rule) < 0) {
        throw Failure("cannot write " + kFile + "; make sure that its folder exists and that you may write it",
                      store::Cause::Denied);
    }
    WriteLine("set rule " + options.name + ": " + typeName(rule) + " " + threshold(rule) +
              (rule.notify_enable ? "" : ", disabled"));
    RecordDeed("Set rule " + options.name + ": " + typeName(rule) + " " + threshold(rule) +
               (rule.notify_enable ? "" : ", disabled"));
    putInForce(rule);
    return kDone;
}

struct TestOptions {
    std::string level;
    std::string message;
    uint64_t eps = 0;
    OutputOptions output;
};

void setupTest(CLI::App& command, TestOptions& options) {
    addLevel(command, options.level, "A log of this level");
    command.add_option("--message", options.message, "A log with this message")->type_name("TEXT");
    AddNumberOption(command, "--eps", options.eps, "A sample of this many logs");
    AddOutputOptions(command, options.output);
}

int runTest(const TestOptions& options) {
    if (options.level.empty() && options.message.empty() && options.eps == 0) {
        throw Failure("nothing to test; give --level, --message or --eps");
    }
    NotificationManager manager;
    bool any = false;
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"type"}, {"given"}, {"notifies"}, {"keyword"}}, out);
    const auto tell = [&](RuleType type, const std::string& given, bool notifies, const std::string& keyword) {
        any = any || notifies;
        sink->row({kTypeNames[static_cast<size_t>(type)], given, notifies ? "yes" : "no", keyword});
    };
    if (!options.level.empty()) {
        tell(kSeverity, options.level, manager.CheckSev(PriorStrToType(options.level.c_str())), "");
    }
    if (options.eps != 0) {
        tell(kEps, std::to_string(options.eps), manager.CheckEps(options.eps), "");
    }
    if (!options.message.empty()) {
        const std::string keyword = manager.CheckKeyword(options.message);
        tell(kKeyword, options.message, !keyword.empty(), keyword);
    }
    sink->finish();
    return any ? kDone : kNothing;
}

}  // namespace

void AddRules(CLI::App& app, int& status) {
    CLI::App& rules = *app.add_subcommand("rules", "Notification rules");
    rules.require_subcommand(1);
    AddCommand<OutputOptions>(rules, "list", "Print the rules", status, setupList, runList);
    AddCommand<SetOptions>(rules, "set", "Add or change a rule", status, setupSet, runSet);
    AddCommand<TestOptions>(rules, "test", "Tell whether a log would set off a notice", status, setupTest, runTest);
}

}  // namespace quor::cli
