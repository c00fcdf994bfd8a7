// rules test, try: what the rules would do.
#include <ctime>

#include "base/numbers.h"
#include "base/paths.h"
#include "rules/matches.h"
#include "rules/rulefile.h"
#include "store/selection.h"
#include "tools/quorlog/commands/rulecommands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/rulefiles.h"

namespace quor::cli {
namespace {

struct TestOptions {
    std::string level;
    std::string message;
    std::string host;
    std::string program;
    std::string facility;
    uint64_t eps = 0;
    OutputOptions output;
};

void setupTest(CLI::App& command, TestOptions& options) {
    command.add_option("--level", options.level, "A log of this level")->type_name("NAME");
    command.add_option("--message", options.message, "A log with this message")->type_name("TEXT");
    command.add_option("--host", options.host, "A log of this host")->type_name("NAME");
    command.add_option("--program", options.program, "A log of this program")->type_name("NAME");
    command.add_option("--facility", options.facility, "A log of this facility")->type_name("NAME");
    AddNumberOption(command, "--eps", options.eps, "A sample of this many logs");
    AddOutputOptions(command, options.output);
}

bool hasLog(const TestOptions& options) {
    return !(options.level + options.message + options.host + options.program + options.facility).empty();
}

store::Record recordOf(const TestOptions& options) {
    store::Record record;
    record.prio = static_cast<_SYSLOG_DB_PRIORITY_tag>(
        options.level.empty() ? static_cast<int>(SYSLOG_PRIORITY_DEBUG) : rules::ParseLevel(options.level, "--level"));
    record.msg = options.message;
    record.host = options.host;
    record.prog = options.program;
    record.fac = options.facility;
    return record;
}

class Verdicts {
  public:
    explicit Verdicts(RowSink& sink) : sink_(sink) {}

    void tell(const std::string& type, const std::string& given, const std::string& notifies,
              const std::string& keyword = "", const std::string& rule = "") {
        any_ = any_ || notifies != "no";
        sink_.row({type, given, notifies, keyword, rule});
    }
    bool any() const { return any_; }

  private:
    RowSink& sink_;
    bool any_ = false;
};

const char* yesOrNo(bool yes) {
    return yes ? "yes" : "no";
}

void testNotifyRules(const TestOptions& options, const store::Record& record, Verdicts& verdicts) {
    NotificationManager manager;
    if (!options.level.empty()) {
        verdicts.tell(kNotifyTypeNames[kSeverity], PriorTypeToStr(record.prio), yesOrNo(manager.CheckSev(record.prio)));
    }
    if (options.eps != 0) {
        verdicts.tell(kNotifyTypeNames[kEps], Decimal(options.eps), yesOrNo(manager.CheckEps(options.eps)));
    }
    if (!options.message.empty()) {
        const std::string keyword = manager.CheckKeyword(options.message);
        verdicts.tell(kNotifyTypeNames[kKeyword], options.message, yesOrNo(!keyword.empty()), keyword);
    }
}

void testRules(const store::Record& record, Verdicts& verdicts) {
    const rules::Subject subject(record);
    for (const rules::Rule& rule : rules::LoadRules(paths::kRules)) {
        if (rule.enabled && rule.kind == rules::Kind::Match && rules::Matcher(rule).matches(subject)) {
            const std::string times =
                rule.count > 1 ? std::to_string(rule.count) + " within " + rules::SpanText(rule.within) : "yes";
            verdicts.tell("match", rules::Describe(rule), times, rule.keyword, rule.name);
        }
    }
}

int runTest(const TestOptions& options) {
    if (!hasLog(options) && options.eps == 0) {
        throw Failure("nothing to test; give --level, --message or --eps");
    }
    const store::Record record = recordOf(options);
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"type"}, {"given"}, {"notifies"}, {"keyword"}, {"rule"}}, out);
    Verdicts verdicts(*sink);
    testNotifyRules(options, record, verdicts);
    if (hasLog(options)) {
        testRules(record, verdicts);
    }
    sink->finish();
    return verdicts.any() ? kDone : kNothing;
}

struct TryOptions {
    std::string name;
    std::string db = paths::kWorkingDb;
    store::FilterOptions filters;
    OutputOptions output;
};

void setupTry(CLI::App& command, TryOptions& options) {
    command.add_option("name", options.name, "Name of a rule set with rules set")->type_name("NAME")->required();
    AddDatabaseOption(command, options.db);
    command
        .add_option("--last", options.filters.last, "Over the rows of so long a time: 6h, 2d; all of them by default")
        ->type_name("SPAN");
    AddOutputOptions(command, options.output);
}

// The last notice about each host, to see which of the next ones the interval holds back.
class Notices {
  public:
    explicit Notices(int64_t interval) : interval_(interval) {}

    bool take(const std::string& host, int64_t second) {
        const auto [last, first] = last_.try_emplace(host, second);
        const bool due = first || second - last->second >= interval_;
        last->second = due ? second : last->second;
        return due;
    }

  private:
    int64_t interval_;
    std::map<std::string, int64_t> last_;
};

int runTry(const TryOptions& options) {
    const std::optional<rules::Rule> rule = FindRule(options.name);
    if (!rule || rule->kind != rules::Kind::Match) {
        throw Failure("no rule of kind match is called '" + options.name + "'; quorlog rules list shows them",
                      store::Cause::Missing);
    }
    const auto source = store::OpenSource(options.db);
    store::Selection selection;
    selection.filter = BuildFilter(options.filters, "logs", time(nullptr));
    selection.oldestFirst = true;
    rules::Rule enabled = *rule;
    enabled.enabled = true;
    rules::Matches matches;
    matches.setRules({enabled});
    Notices due(rules::IntervalOf(*rule));
    uint64_t fired = 0;
    uint64_t notices = 0;
    const uint64_t rows = Select(*source, selection, [&](const store::Record& record) {
        const int64_t second = record.rsec != 0 ? record.rsec : record.utcsec;
        const bool fires = !matches.take(record, record.host, second).empty();
        fired += fires ? 1 : 0;
        notices += fires && due.take(record.host, second) ? 1 : 0;
    });
    Output out(STDOUT_FILENO);
    WriteRecord(options.output.style(),
                {{"rows", Decimal(rows), Kind::Number},
                 {"fires", Decimal(fired), Kind::Number},
                 {"notices", Decimal(notices), Kind::Number}},
                out);
    return fired == 0 ? kNothing : kDone;
}

}  // namespace

void AddRuleTests(CLI::App& parent, int& status) {
    AddCommand<TestOptions>(parent, "test", "Tell whether a log would set off a notice", status, setupTest, runTest);
    AddCommand<TryOptions>(parent, "try", "Tell how often a rule would have fired over the stored rows", status,
                           setupTry, runTry);
}

}  // namespace quor::cli
