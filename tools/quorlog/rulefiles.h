// The two files that rules stand in: notify.conf, with the three kinds that the library checks, and rules.conf.
#ifndef QUORLOG_RULEFILES_H
#define QUORLOG_RULEFILES_H

#include <array>
#include <optional>
#include <string>
#include <vector>

#include "base/guards.h"
#include "notification.h"
#include "rules/rule.h"

namespace quor::cli {

using NotifyRule = _SYSLOG_NOTIFY_RULES_tag;

enum NotifyType : int32_t { kSeverity = 0, kEps = 1, kKeyword = 2 };
constexpr std::array<const char*, 3> kNotifyTypeNames = {"severity", "eps", "keyword"};

// One change at a time, from reading the rules to writing them; waits for the one before.
class RulesLock {
  public:
    RulesLock();

  private:
    Descriptor folder_;
};

std::vector<std::string> NotifyRuleNames();
bool IsNotifyRule(const std::string& name);
// Nothing when it lacks a key.
std::optional<NotifyRule> LoadNotifyRule(const std::string& name);
void SaveNotifyRule(NotifyRule rule);
void RemoveNotifyRule(const std::string& name);
void RenameNotifyRule(const std::string& name, const std::string& newName);
std::string TypeOf(const NotifyRule& rule);
std::string ThresholdOf(const NotifyRule& rule);

// Nothing when rules.conf has no rule of that name.
std::optional<rules::Rule> FindRule(const std::string& name);

// Failure for a name that neither file can hold.
void CheckRuleName(const std::string& name);

// Has the quorlogd that runs read the rules, and says `effect`; or says why it cannot.
void PutInForce(const std::string& effect);
// A rule whose notices reach nobody should not be a surprise later.
void WarnOfNoChannel();

}  // namespace quor::cli

#endif
