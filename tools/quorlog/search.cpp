// search and count.
#include <poll.h>
#include <signal.h>
#include <sys/signalfd.h>
#include <sys/stat.h>

#include <algorithm>
#include <ctime>
#include <iostream>
#include <vector>

#include "commands.h"
#include "common/paths.h"
#include "database.h"
#include "options.h"
#include "records.h"
#include "selection.h"

namespace quor::cli {
namespace {

constexpr uint64_t kTableRows = 50;   // what a person gets without a limit
constexpr uint64_t kFollowRows = 10;  // the rows before the new ones

struct SearchOptions {
    std::string db = paths::kWorkingDb;
    std::string table = "logs";
    FilterOptions filters;
    OutputOptions output;
    uint64_t limit = 0;
    uint64_t offset = 0;
    uint64_t before = 0;
    bool limited = false;
    bool oldest = false;
    bool follow = false;
    uint64_t interval = 1;
};

// Which filter left nothing, as far as that can be told without reading every message.
std::string whyNothing(const Selection& selection, const SearchOptions& options) {
    const auto none = [&](const Conditions& conditions) { return !AnyRow(selection.db, selection.table, conditions); };
    if (none({})) {
        return "table " + selection.table + " is empty";
    }
    if (options.before != 0 && none({IdCondition(kBelow, options.before)})) {
        return "no row has an id below " + std::to_string(options.before);
    }
    const std::vector<Probe> probes = BuildProbes(options.filters, selection.table, time(nullptr));
    for (const Probe& probe : probes) {
        if (none(probe.conditions)) {
            return "no row " + probe.words;
        }
    }
    if (selection.offset != 0 && !none(selection.filter.conditions)) {
        return "--offset is beyond the last row";
    }
    return probes.empty() ? "no message matches" : "no row matches all filters together";
}

int reportNothing(const Selection& selection, const SearchOptions& options) {
    std::cerr << "quorlog: nothing found: " << whyNothing(selection, options) << '\n';
    return kNothing;
}

Selection selectionOf(const SearchOptions& options) {
    Selection selection;
    selection.filter = BuildFilter(options.filters, options.table, time(nullptr));
    selection.db = RequireLogDatabase(options.db);
    selection.table = options.table;
    selection.offset = options.offset;
    selection.oldestFirst = options.oldest;
    selection.limit = options.limit;
    if (options.before != 0) {
        selection.filter.conditions.push_back(IdCondition(kBelow, options.before));
    }
    return selection;
}

// Waits for the next look at the database; ends on SIGINT and SIGTERM, and when the reader of the output has gone.
class Ticker {
  public:
    explicit Ticker(uint64_t seconds) : milliseconds_(static_cast<int>(std::min(seconds, kMaxSeconds) * 1000)) {
        sigset_t ending;
        sigemptyset(&ending);
        sigaddset(&ending, SIGINT);
        sigaddset(&ending, SIGTERM);
        sigprocmask(SIG_BLOCK, &ending, nullptr);
        signals_ = signalfd(-1, &ending, SFD_CLOEXEC);
    }
    Ticker(const Ticker&) = delete;
    Ticker& operator=(const Ticker&) = delete;
    ~Ticker() { close(signals_); }

    // False when it is over.
    bool wait() const {
        pollfd watched[] = {{signals_, POLLIN, 0}, {STDOUT_FILENO, 0, 0}};
        if (poll(watched, 2, milliseconds_) > 0 && (watched[1].revents & POLLERR) != 0) {
            throw Failure("cannot write the output: its reader has gone");
        }
        return watched[0].revents == 0;
    }

  private:
    static constexpr uint64_t kMaxSeconds = 86400;

    int milliseconds_;
    int signals_;
};

// Which file the path names: the working database is removed and created anew when it has grown too large.
ino_t fileOf(const std::string& path) {
    struct stat status = {};
    return stat(path.c_str(), &status) == 0 ? status.st_ino : 0;
}

// Prints the last rows up to the id `last`, in the order in which they came.
void printLast(Selection selection, uint64_t last, RecordSink& sink) {
    selection.filter.conditions.push_back(IdCondition(kAtMost, last));
    selection.oldestFirst = selection.limit == 0;  // all of them need no turning round
    std::vector<_SYSLOG_LOG_DATA_tag> rows;
    Select(selection, [&](const auto& record) { selection.oldestFirst ? sink.add(record) : rows.push_back(record); });
    std::for_each(rows.rbegin(), rows.rend(), [&](const auto& record) { sink.add(record); });
}

int follow(const SearchOptions& options, Selection selection) {
    Output out(STDOUT_FILENO);
    RecordSink sink(options.output.style(), selection.table, out);
    const Ticker ticker(options.interval);
    ino_t file = fileOf(selection.db);
    uint64_t last = EstimateCount(selection);
    selection.limit = options.limited ? options.limit : kFollowRows;
    printLast(selection, last, sink);
    sink.flush();
    while (ticker.wait()) {
        const ino_t now = fileOf(selection.db);
        last = now == file ? last : 0;
        try {
            SelectAfter(selection, last, [&](const auto& record) {
                last = record.id;
                sink.add(record);
            });
            file = now;
        } catch (const QueryFailure&) {
            if (now == file) {
                throw;
            }
            continue;  // a new database has no table before its first row
        }
        sink.flush();
    }
    sink.finish();
    return kDone;
}

int runSearch(const SearchOptions& options) {
    Selection selection = selectionOf(options);
    if (options.follow) {
        return follow(options, selection);
    }
    const Style style = options.output.style();
    if (!options.limited && style.format == Format::Table) {
        selection.limit = kTableRows;
    }
    Output out(STDOUT_FILENO);
    RecordSink sink(style, selection.table, out);
    const uint64_t rows = Select(selection, [&](const auto& record) { sink.add(record); });
    sink.finish();
    return rows == 0 ? reportNothing(selection, options) : kDone;
}

struct CountOptions {
    SearchOptions search;
    bool estimate = false;
};

int runCount(const CountOptions& options) {
    const Selection selection = selectionOf(options.search);
    if (options.estimate && !selection.filter.conditions.empty()) {
        throw Failure("--estimate counts the whole table; leave out the filters or --estimate");
    }
    const uint64_t count = options.estimate ? EstimateCount(selection) : Count(selection);
    const Style style = options.search.output.style();
    if (style.format == Format::Table) {
        WriteLine(std::to_string(count));
    } else {
        Output out(STDOUT_FILENO);
        WriteRecord(style, {{"count", std::to_string(count), Kind::Number}}, out);
    }
    return count == 0 ? reportNothing(selection, options.search) : kDone;
}

void setupBoth(CLI::App& command, SearchOptions& options) {
    AddDatabaseOption(command, options.db);
    AddTableOption(command, options.table);
    AddFilterOptions(command, options.filters);
    AddOutputOptions(command, options.output);
}

void setupSearch(CLI::App& command, SearchOptions& options) {
    setupBoth(command, options);
    AddNumberOption(command, "--limit", options.limit, "Rows wanted, 0 for all; a table shows 50 by default")
        ->each([&options](const std::string&) { options.limited = true; });
    CLI::Option* offset = AddNumberOption(command, "--offset", options.offset, "Rows skipped");
    CLI::Option* before = AddNumberOption(command, "--before", options.before,
                                          "Only ids below this: the next page, however deep, at once");
    CLI::Option* oldest = command.add_flag("--oldest", options.oldest, "Oldest rows first, instead of newest");
    CLI::Option* following = command.add_flag("--follow", options.follow, "Print new rows as they arrive, until ^C");
    following->excludes(offset)->excludes(oldest)->excludes(before);
    AddNumberOption(command, "--interval", options.interval, "Seconds between two looks for new rows")
        ->needs(following);
}

void setupCount(CLI::App& command, CountOptions& options) {
    setupBoth(command, options.search);
    command.add_flag("--estimate", options.estimate,
                     "The largest id instead of a count: at once, above it after deletions");
}

}  // namespace

void AddSearch(CLI::App& app, int& status) {
    AddCommand<SearchOptions>(app, "search", "Print log rows, newest first", status, setupSearch, runSearch);
}

void AddCount(CLI::App& app, int& status) {
    AddCommand<CountOptions>(app, "count", "Count log rows", status, setupCount, runCount);
}

}  // namespace quor::cli
