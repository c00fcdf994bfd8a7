// rules list, delete, rename, disable, enable: the notification rules of both files.
#include <algorithm>

#include "base/paths.h"
#include "rules/rulefile.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/commands/rulecommands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/rulefiles.h"

namespace quor::cli {
namespace {

void setupList(CLI::App& command, OutputOptions& output) {
    AddOutputOptions(command, output);
}

const char* yesOrNo(bool yes) {
    return yes ? "yes" : "no";
}

// The first rule that lacks a key, or the empty text.
std::string listNotifyRules(const std::vector<std::string>& names, RowSink& sink) {
    std::string bad;
    for (const std::string& name : names) {
        const std::optional<NotifyRule> rule = LoadNotifyRule(name);
        if (rule) {
            sink.row({rule->name, TypeOf(*rule), ThresholdOf(*rule), yesOrNo(rule->notify_enable)});
        } else {
            bad = bad.empty() ? name : bad;
        }
    }
    return bad;
}

int runList(const OutputOptions& options) {
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.style(), {{"name"}, {"type"}, {"threshold"}, {"enabled"}}, out);
    const std::vector<std::string> names = NotifyRuleNames();
    const std::string bad = listNotifyRules(names, *sink);
    std::vector<rules::Rule> others;
    std::optional<Failure> damage;
    try {
        others = rules::LoadRules(paths::kRules);
    } catch (const Failure& failure) {
        damage = failure;
    }
    for (const rules::Rule& rule : others) {
        sink->row({rule.name, rules::kKindNames[static_cast<size_t>(rule.kind)], rules::Describe(rule),
                   yesOrNo(rule.enabled)});
    }
    sink->finish();
    if (damage) {
        throw Failure(*damage);
    }
    if (!bad.empty()) {
        throw Failure("rule '" + bad + "' of " + paths::kNotifyRules +
                      " lacks a key, and no rule after it is loaded; "
                      "repair it with quorlog rules set");
    }
    return names.empty() && others.empty() ? ReportNothing("no rules are set") : kDone;
}

struct NameOptions {
    std::string name;
    std::string newName;
};

void setupName(CLI::App& command, NameOptions& options) {
    command.add_option("name", options.name, "Name of the rule")->type_name("NAME")->required();
}

void setupRename(CLI::App& command, NameOptions& options) {
    setupName(command, options);
    command.add_option("new", options.newName, "Its new name")->type_name("NAME")->required();
}

rules::Rule requireRule(const std::string& name) {
    const std::optional<rules::Rule> rule = FindRule(name);
    if (!rule) {
        throw Failure("no rule is called '" + name + "'; quorlog rules list shows their names", store::Cause::Missing);
    }
    return *rule;
}

int runDelete(const NameOptions& options) {
    const RulesLock alone;
    if (IsNotifyRule(options.name)) {
        RemoveNotifyRule(options.name);
    } else {
        rules::RemoveRule(paths::kRules, requireRule(options.name).name);
    }
    WriteLine("deleted rule " + options.name);
    RecordDeed("Deleted rule " + options.name);
    PutInForce("leaves it out");
    return kDone;
}

int runRename(const NameOptions& options) {
    const RulesLock alone;
    CheckRuleName(options.newName);
    const bool notify = IsNotifyRule(options.name);
    std::optional<rules::Rule> rule = notify ? std::nullopt : std::optional(requireRule(options.name));
    if (IsNotifyRule(options.newName) || FindRule(options.newName)) {
        throw Failure("a rule '" + options.newName + "' exists already; give another name, or delete that one first");
    }
    if (notify) {
        RenameNotifyRule(options.name, options.newName);
    } else {
        rule->name = options.newName;
        rules::SaveRule(paths::kRules, options.name, *rule);
    }
    WriteLine("renamed rule " + options.name + " to " + options.newName);
    RecordDeed("Renamed rule " + options.name + " to " + options.newName);
    PutInForce("knows it by this name");
    return kDone;
}

void enableNotifyRule(const std::string& name, bool enable) {
    std::optional<NotifyRule> rule = LoadNotifyRule(name);
    if (!rule) {
        throw Failure("rule '" + name + "' lacks a key; repair it with quorlog rules set");
    }
    rule->notify_enable = enable;
    SaveNotifyRule(*rule);
}

int enable(const std::string& name, bool enable) {
    const RulesLock alone;
    if (IsNotifyRule(name)) {
        enableNotifyRule(name, enable);
    } else {
        rules::Rule rule = requireRule(name);
        rule.enabled = enable;
        rules::SaveRule(paths::kRules, name, rule);
    }
    WriteLine((enable ? "enabled rule " : "disabled rule ") + name);
    RecordDeed((enable ? "Enabled rule " : "Disabled rule ") + name);
    PutInForce(enable ? "checks by it" : "leaves it out");
    if (enable) {
        WarnOfNoChannel();
    }
    return kDone;
}

int runEnable(const NameOptions& options) {
    return enable(options.name, true);
}

int runDisable(const NameOptions& options) {
    return enable(options.name, false);
}

}  // namespace

void AddRules(CLI::App& app, int& status) {
    CLI::App& rules = *app.add_subcommand("rules", "Notification rules");
    rules.require_subcommand(1);
    AddCommand<OutputOptions>(rules, "list", "Print the rules", status, setupList, runList);
    AddRuleChanges(rules, status);
    AddCommand<NameOptions>(rules, "delete", "Delete a rule", status, setupName, runDelete);
    AddCommand<NameOptions>(rules, "rename", "Give a rule another name", status, setupRename, runRename);
    AddCommand<NameOptions>(rules, "disable", "Keep a rule, but do not check it", status, setupName, runDisable);
    AddCommand<NameOptions>(rules, "enable", "Check a rule again", status, setupName, runEnable);
    AddRuleTests(rules, status);
}

}  // namespace quor::cli
