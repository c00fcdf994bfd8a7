#include "rules/rulefile.h"

#include <algorithm>
#include <optional>
#include <set>
#include <utility>

#include "base/sectionlines.h"
#include "base/textfile.h"
#include "store/failure.h"

namespace quor::rules {
namespace {

using store::Cause;
using store::Failure;

constexpr size_t kMostRules = 200;
constexpr const char kVersion[] = "1";
constexpr const char kHead[] = "# Rules of the log server beside those of notify.conf; see rules.conf(5) and "
                               "\"quorlog rules\".\nversion=\"1\"\n";

// Takes the file line by line.
class Reader {
  public:
    explicit Reader(const std::string& path) : path_(path) {}

    void take(const SectionLine& line) {
        ++number_;
        switch (line.kind) {
        case SectionLine::Kind::Header:
            beginRule(std::string(line.name));
            break;
        case SectionLine::Kind::Entry:
            takeEntry(std::string(line.name), std::string(line.value));
            break;
        default:
            takeOther(line.whole);
        }
    }

    std::vector<Rule> finish() {
        endRule();
        return std::move(rules_);
    }

  private:
    [[noreturn]] void fail(const std::string& what) const {
        throw Failure(path_ + ", line " + std::to_string(number_) + ": " + what, Cause::Damaged);
    }

    template <typename Step>
    void guarded(Step&& step) const {
        try {
            step();
        } catch (const Failure& failure) {
            fail(failure.what());
        }
    }

    void takeOther(std::string_view whole) const {
        const size_t first = whole.find_first_not_of(" \t\r\n\xEF\xBB\xBF");
        if (first != std::string_view::npos && whole[first] != '#' && whole[first] != ';') {
            fail("neither a comment nor key=\"value\"");
        }
    }

    void beginRule(const std::string& name) {
        endRule();
        guarded([&] { CheckName(name); });
        if (!versioned_) {
            fail(std::string("version=\"") + kVersion + "\" does not stand before the first rule");
        }
        if (!names_.insert(name).second) {
            fail("a second rule '" + name + "'");
        }
        if (rules_.size() == kMostRules) {
            fail("more than " + std::to_string(kMostRules) + " rules");
        }
        open_.emplace();
        open_->name = name;
        keys_.clear();
    }

    void takeEntry(const std::string& key, const std::string& value) {
        if (!open_) {
            takeVersion(key, value);
            return;
        }
        if (!keys_.insert(key).second) {
            fail("a second '" + key + "'");
        }
        if (key == "kind") {
            takeKind(value);
        } else if (key == "enabled") {
            takeEnabled(value);
        } else {
            takeField(key, value);
        }
    }

    void takeVersion(const std::string& key, const std::string& value) {
        if (key != "version") {
            fail("'" + key + "' belongs to no rule");
        }
        if (value != kVersion) {
            fail("version " + value + " is not known; a newer quorlog wrote this file");
        }
        versioned_ = true;
    }

    void takeKind(const std::string& value) {
        const auto* const known = std::find(kKindNames.begin(), kKindNames.end(), value);
        if (known == kKindNames.end() || keys_.size() != 1) {
            fail(known == kKindNames.end() ? "no such kind '" + value + "'; give match, silent, rate or newdevice"
                                           : "the kind has to be the first line of a rule");
        }
        open_->kind = static_cast<Kind>(known - kKindNames.begin());
    }

    void takeEnabled(const std::string& value) {
        if (value != "yes" && value != "no") {
            fail("enabled is neither yes nor no");
        }
        open_->enabled = value == "yes";
    }

    void takeField(const std::string& key, const std::string& value) {
        const Field* const field = FieldOf(open_->kind, key);
        if (field == nullptr) {
            fail("a rule of this kind has no '" + key + "'");
        }
        guarded([&] { field->set(*open_, value, key); });
    }

    void endRule() {
        if (open_) {
            guarded([&] { CheckComplete(*open_); });
            rules_.push_back(*std::exchange(open_, std::nullopt));
        }
    }

    const std::string& path_;
    size_t number_ = 0;
    bool versioned_ = false;
    std::optional<Rule> open_;
    std::set<std::string> names_;
    std::set<std::string> keys_;  // of the open rule
    std::vector<Rule> rules_;
};

std::string sectionOf(const Rule& rule) {
    std::string text = "[" + rule.name + "]\nkind=\"" + kKindNames[static_cast<size_t>(rule.kind)] + "\"\n";
    for (const Field& field : Fields()) {
        const std::string value = field.text(rule);
        if (!value.empty()) {
            text.append(field.key).append("=\"").append(value).append("\"\n");
        }
    }
    return text + "enabled=\"" + (rule.enabled ? "yes" : "no") + "\"\n";
}

std::string textOf(const std::string& path) {
    std::string text;
    if (ReadTextFile(path, kMostSectionBytes, text) == ReadOutcome::Failed) {
        throw Failure("cannot read " + path + "; make sure that it is a text file below 1 MiB and that you may",
                      Cause::Denied);
    }
    return text;
}

// What is written has to be understood by those who read it.
void replace(const std::string& path, const std::string& text) {
    (void)ParseRules(text, path);
    if (text.size() > kMostSectionBytes || !ReplaceTextFile(path, text)) {
        throw Failure("cannot write " + path + "; make sure that its folder exists and that you may write it",
                      Cause::Denied);
    }
}

}  // namespace

std::vector<Rule> ParseRules(std::string_view text, const std::string& path) {
    Reader reader(path);
    for (const SectionLine& line : ParseSectionLines(text)) {
        reader.take(line);
    }
    return reader.finish();
}

std::vector<Rule> LoadRules(const std::string& path) {
    return ParseRules(textOf(path), path);
}

void SaveRule(const std::string& path, const std::string& name, const Rule& rule) {
    const std::string text = textOf(path);
    (void)ParseRules(text, path);  // a damaged one is repaired by a person, not overwritten
    replace(path, WithSection(text.empty() ? kHead : text, name, sectionOf(rule)));
}

void RemoveRule(const std::string& path, const std::string& name) {
    replace(path, WithSection(textOf(path), name, ""));
}

}  // namespace quor::rules
