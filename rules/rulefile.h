// The file of the rules: rules.conf(5).
#ifndef RULES_RULEFILE_H
#define RULES_RULEFILE_H

#include <string>
#include <string_view>
#include <vector>

#include "rules/rule.h"

namespace quor::rules {

// The rules in the order of the file; none when there is no file. Failure, which names the line, for a file that is not
// understood to the last line: half of the rules would look like all of them.
std::vector<Rule> LoadRules(const std::string& path);
// The same of a file's text.
std::vector<Rule> ParseRules(std::string_view text, const std::string& path);

// Puts `rule` in place of the one called `name`, or adds it. Comments stay; a crash leaves the old or the new file.
void SaveRule(const std::string& path, const std::string& name, const Rule& rule);
void RemoveRule(const std::string& path, const std::string& name);

}  // namespace quor::rules

#endif
