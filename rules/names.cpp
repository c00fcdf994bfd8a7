#include "rules/names.h"

#include <algorithm>
#include <list>

#include "base/utf8.h"
#include "store/names.h"

namespace quor::rules {

// Goes back to the last "*" only: an earlier one need never take more than it has. So no text makes it slow.
bool MatchesGlob(std::string_view pattern, std::string_view text) {
    constexpr size_t kNone = std::string_view::npos;
    size_t at = 0;
    size_t star = kNone;  // behind the last "*"
    size_t from = 0;      // what follows it begins here in the text
    size_t next = 0;
    while (next < text.size()) {
        if (at < pattern.size() && pattern[at] == '*') {
            star = ++at;
            from = next;
        } else if (at < pattern.size() && pattern[at] == '?') {
            ++at;
            next += NextSymbol(text, next).length;
        } else if (at < pattern.size() && pattern[at] == text[next]) {
            ++at;
            ++next;
        } else if (star != kNone) {
            at = star;
            from += NextSymbol(text, from).length;
            next = from;
        } else {
            return false;
        }
    }
    return pattern.find_first_not_of('*', at) == kNone;
}

Names::Names(const std::string& list) {
    for (const std::string& name : list.empty() ? std::list<std::string>() : store::NamesOf({list}, "", false)) {
        (name.find_first_of("*?") == std::string::npos ? exact_ : patterns_).push_back(name);
    }
}

bool Names::has(std::string_view name) const {
    return std::find(exact_.begin(), exact_.end(), name) != exact_.end() ||
           std::any_of(patterns_.begin(), patterns_.end(),
                       [name](const std::string& pattern) { return MatchesGlob(pattern, name); });
}

}  // namespace quor::rules
