#include "tools/quorlog/rulefiles.h"

#include <fcntl.h>
#include <sys/file.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>

#include "base/paths.h"
#include "base/sectionlines.h"
#include "base/textfile.h"
#include "common/handles.h"
#include "rules/rulefile.h"
#include "store/channels.h"
#include "store/failure.h"
#include "store/receiving.h"
#include "tools/quorlog/display.h"
#include "tools/quorlog/messages.h"

namespace quor::cli {
namespace {

using store::Failure;

const std::string kFile = paths::kNotifyRules;

[[noreturn]] void failWrite() {
    throw Failure("cannot write " + kFile + "; make sure that its folder exists and that you may write it",
                  store::Cause::Denied);
}

// Puts other lines in place of a section: what `change` makes of its entries.
template <typename Change>
void changeSection(const std::string& name, Change change) {
    std::string text;
    if (ReadTextFile(kFile, kMostSectionBytes, text) != ReadOutcome::Done) {
        throw Failure("cannot read " + kFile + "; make sure that you may", store::Cause::Denied);
    }
    const SectionLines lines = ParseSectionLines(text);
    const SectionRange range = FindSection(lines, name).value_or(SectionRange{lines.size(), lines.size()});
    std::string entries;
    for (size_t i = range.header; i < range.end; ++i) {
        entries.append(lines[i].kind == SectionLine::Kind::Entry ? lines[i].whole : std::string_view());
    }
    if (!ReplaceTextFile(kFile, WithSection(text, name, change(entries)))) {
        failWrite();
    }
}

}  // namespace

// Who may not read the folder may not write it either, and hears so then.
RulesLock::RulesLock()
    : folder_(open(std::filesystem::path(kFile).parent_path().c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC)) {
    (void)flock(folder_.get(), LOCK_EX);
}

std::vector<std::string> NotifyRuleNames() {
    StringList list(QLIBCSzListAlloc(16));
    std::vector<std::string> names;
    if (QLIBCFileExist(paths::kNotifyRules) == 1 && QLIBCFileEnumSection(paths::kNotifyRules, Adopt(list)) < 0) {
        throw Failure("cannot read " + kFile + "; make sure that you may", store::Cause::Denied);
    }
    names.assign(list->items, list->items + list->count);
    return names;
}

bool IsNotifyRule(const std::string& name) {
    const std::vector<std::string> names = NotifyRuleNames();
    return std::find(names.begin(), names.end(), name) != names.end();
}

std::optional<NotifyRule> LoadNotifyRule(const std::string& name) {
    NotifyRule rule;
    return SyslogNotifyConfGet(kFile, name, rule) < 0 ? std::nullopt : std::optional(rule);
}

void SaveNotifyRule(NotifyRule rule) {
    if (SyslogNotifyConfSet(kFile, rule.name, rule) < 0) {
        failWrite();
    }
}

void RemoveNotifyRule(const std::string& name) {
    changeSection(name, [](const std::string&) { return std::string(); });
}

void RenameNotifyRule(const std::string& name, const std::string& newName) {
    changeSection(name, [&newName](const std::string& entries) { return "[" + newName + "]\n" + entries; });
}

std::string TypeOf(const NotifyRule& rule) {
    const auto type = static_cast<size_t>(rule.notify_type);
    return type < kNotifyTypeNames.size() ? kNotifyTypeNames[type] : "never checked";
}

std::string ThresholdOf(const NotifyRule& rule) {
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

std::optional<rules::Rule> FindRule(const std::string& name) {
    const std::vector<rules::Rule> all = rules::LoadRules(paths::kRules);
    const auto found =
        std::find_if(all.begin(), all.end(), [&name](const rules::Rule& rule) { return rule.name == name; });
    return found == all.end() ? std::nullopt : std::optional(*found);
}

void CheckRuleName(const std::string& name) {
    rules::CheckName(name);
    if (Visible(name) != name) {
        throw Failure("the name '" + name + "' cannot be used; give letters, digits and single blanks");
    }
}

void PutInForce(const std::string& effect) {
    const int process = store::FollowerProcess();
    if (process == 0) {
        Complain("quorlogd does not run; it reads the rules when it starts");
    } else if (kill(process, SIGHUP) != 0) {
        Complain(std::string("quorlogd could not be told: ") + strerror(errno) + "; run: systemctl reload quorlogd");
    } else {
        WriteLine("quorlogd " + effect + " from now on");
    }
}

void WarnOfNoChannel() {
    if (!store::IsChannelSet()) {
        Complain(std::string("matches become events only: no channel for notices is set up in ") +
                 paths::kSystemSettings);
    }
}

}  // namespace quor::cli
