// The rules of kind match, as each stored log meets them.
#ifndef RULES_MATCHES_H
#define RULES_MATCHES_H

#include <memory>
#include <string>
#include <vector>

#include "rules/names.h"
#include "rules/rule.h"
#include "rules/window.h"
#include "store/record.h"

namespace quor::rules {

// A log, with what several rules ask of it made once.
class Subject {
  public:
    explicit Subject(const store::Record& record) : record_(record) {}

    const store::Record& record() const { return record_; }
    // Whether the message, the message id or the structured data holds the text; `small` is in small letters, and asks
    // for no difference of case.
    bool holds(const std::string& text, bool small) const;

  private:
    const store::Record& record_;
    mutable std::string small_;  // the three texts in small letters, apart by a line break
};

class Matcher {
  public:
    explicit Matcher(const Rule& rule);

    bool matches(const Subject& subject) const;

  private:
    Choice hosts_;
    Choice programs_;
    Choice facilities_;
    int level_;
    bool small_;
    std::string keyword_;
    std::string notKeyword_;
    std::string glob_;
};

class Matches {
  public:
    // Takes the enabled rules of its kind; what was counted so far is kept for rules that are as they were.
    void setRules(const std::vector<Rule>& rules);
    bool empty() const { return watched_.empty(); }
    // The rules that a log of `device`, received in that second, sets off. They last until the next call.
    const std::vector<const Rule*>& take(const store::Record& record, const std::string& device, int64_t second);

  private:
    struct Watched {
        Rule rule;
        Matcher matcher;
        std::unique_ptr<Windows> windows;  // none: each match fires
    };

    std::vector<Watched> watched_;
    std::vector<const Rule*> fired_;
};

}  // namespace quor::rules

#endif
