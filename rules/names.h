// Patterns, compared in memory as a search compares them in a database.
#ifndef RULES_NAMES_H
#define RULES_NAMES_H

#include <string>
#include <string_view>
#include <vector>

namespace quor::rules {

// "*" is any text, "?" any one character, everything else itself.
bool MatchesGlob(std::string_view pattern, std::string_view text);

// A list of names with commas between them; "\\," is a comma of a name.
class Names {
  public:
    explicit Names(const std::string& list);

    bool empty() const { return exact_.empty() && patterns_.empty(); }
    bool has(std::string_view name) const;
    // Those without "*" and "?".
    const std::vector<std::string>& exact() const { return exact_; }

  private:
    std::vector<std::string> exact_;
    std::vector<std::string> patterns_;
};

// Names that are asked for, and exceptions from them.
class Choice {
  public:
    Choice(const std::string& wanted, const std::string& unwanted) : wanted_(wanted), unwanted_(unwanted) {}

    bool takes(std::string_view name) const {
        return (wanted_.empty() || wanted_.has(name)) && (unwanted_.empty() || !unwanted_.has(name));
    }
    const std::vector<std::string>& named() const { return wanted_.exact(); }

  private:
    Names wanted_;
    Names unwanted_;
};

}  // namespace quor::rules

#endif
