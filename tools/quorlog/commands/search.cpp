// search.
#include <poll.h>
#include <sys/signalfd.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <ctime>

#include "base/guards.h"
#include "base/paths.h"
#include "store/context.h"
#include "store/follower.h"
#include "store/selection.h"
#include "store/whynothing.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/records.h"

namespace quor::cli {
namespace {

constexpr uint64_t kTableRows = 50;   // what a person gets without a limit
constexpr uint64_t kFollowRows = 10;  // the rows before the new ones

constexpr uint64_t kUnset = UINT64_MAX;

struct SearchOptions {
    std::string db = paths::kWorkingDb;
    std::string table = "logs";
    store::FilterOptions filters;
    OutputOptions output;
    uint64_t limit = 0;
    uint64_t offset = 0;
    uint64_t before = 0;
    bool limited = false;
    bool oldest = false;
    bool follow = false;
    uint64_t interval = 1;
    store::Names columns;
    uint64_t around = 0;
    uint64_t earlier = kUnset;
    uint64_t later = kUnset;
};

// As grep has them: one side by itself goes before both sides together.
void addContextOptions(CLI::App& command, SearchOptions& options, CLI::Option* following) {
    AddNumberOption(command, "-C,--context", options.around, "Rows around each hit, such as 3, with the hits marked")
        ->excludes(following);
    AddNumberOption(command, "-B,--before-context", options.earlier, "Rows from before each hit")->excludes(following);
    AddNumberOption(command, "-A,--after-context", options.later, "Rows from after each hit")->excludes(following);
}

void setup(CLI::App& command, SearchOptions& options) {
    AddDatabaseOption(command, options.db);
    AddTableOption(command, options.table);
    AddFilterOptions(command, options.filters, true);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of rows, 0 for all; 50 on a terminal without a pager")
        ->each([&options](const std::string&) { options.limited = true; });
    CLI::Option* offset = AddNumberOption(command, "--offset", options.offset, "Number of rows to skip");
    CLI::Option* before =
        AddNumberOption(command, "--before", options.before,
                        "Only rows with a smaller id: give the last id of a page to get the next page");
    CLI::Option* oldest = command.add_flag("--oldest", options.oldest, "Oldest rows first, instead of newest");
    CLI::Option* following = command.add_flag("-f,--follow", options.follow, "Print new rows as they arrive, until ^C");
    following->excludes(offset)->excludes(oldest)->excludes(before);
    AddNumberOption(command, "--interval", options.interval, "With --follow: seconds between two looks")
        ->needs(following);
    AddListOption(command, "--columns", options.columns, "Columns to show, in this order, such as time,host,message");
    addContextOptions(command, options, following);
}

Shape shapeOf(const SearchOptions& options, const store::Context& context) {
    Shape shape{options.table, "", context.before + context.after != 0};
    for (const std::string& list : options.columns) {
        shape.columns += "," + list;
    }
    return shape;
}

store::Context contextOf(const SearchOptions& options) {
    const store::Context context{options.earlier == kUnset ? options.around : options.earlier,
                                 options.later == kUnset ? options.around : options.later};
    if (std::max(context.before, context.after) > store::kMostContext) {
        throw Failure("--context: more than " + std::to_string(store::kMostContext) + " rows around a hit; give less");
    }
    return context;
}

store::Selection selectionOf(const SearchOptions& options) {
    store::Selection selection;
    selection.filter = BuildFilter(options.filters, options.table, time(nullptr));
    selection.table = options.table;
    selection.offset = options.offset;
    selection.oldestFirst = options.oldest;
    selection.limit = options.limit;
    if (options.before != 0) {
        selection.filter.conditions.attributes.push_back(store::IdCondition(SYSLOG_OP_BELOW, options.before));
    }
    return selection;
}

// Waits for the next look at the database; ends on SIGINT and SIGTERM, and when the reader of the output has gone.
class Ticker {
  public:
    explicit Ticker(uint64_t seconds)
        : milliseconds_(static_cast<int>(std::clamp(seconds, kMinSeconds, kMaxSeconds) * 1000)) {
        sigset_t ending;
        sigemptyset(&ending);
        sigaddset(&ending, SIGINT);
        sigaddset(&ending, SIGTERM);
        sigprocmask(SIG_BLOCK, &ending, nullptr);
        signals_ = Descriptor(signalfd(-1, &ending, SFD_CLOEXEC));
    }

    // False when it is over.
    bool wait() const {
        pollfd watched[] = {{signals_.get(), POLLIN, 0}, {STDOUT_FILENO, 0, 0}};
        if (poll(watched, 2, milliseconds_) > 0 && (watched[1].revents & POLLERR) != 0) {
            throw Failure("cannot write the output: its reader has gone", store::Cause::Other);
        }
        return watched[0].revents == 0;
    }

  private:
    static constexpr uint64_t kMinSeconds = 1;
    static constexpr uint64_t kMaxSeconds = 86400;

    int milliseconds_;
    Descriptor signals_;
};

int follow(const SearchOptions& options, const store::Source& source, const store::Selection& selection) {
    Style style = options.output.style();
    style.pager.clear();  // it would wait for the end
    Output out(STDOUT_FILENO);
    RecordSink sink(style, shapeOf(options, {}), out);
    const auto print = [&](const auto& record) { sink.add(record); };
    const Ticker ticker(options.interval);
    store::Follower follower(source, selection);
    follower.last(options.limited ? options.limit : kFollowRows, print);
    sink.flush();
    while (ticker.wait()) {
        while (follower.poll(print)) {
        }
        sink.flush();
    }
    sink.finish();
    return kDone;
}

// A person sees the first rows, and how to see the others.
void tellMore(const store::Source& source, store::Selection rest, uint64_t last) {
    rest.filter.conditions.attributes.push_back(
        store::IdCondition(rest.oldestFirst ? SYSLOG_OP_ABOVE : SYSLOG_OP_BELOW, last));
    const uint64_t more = Count(source, rest);
    if (more != 0) {
        Complain(std::to_string(more) + (more == 1 ? " more row" : " more rows") + "; all of them: -n 0" +
                 (rest.oldestFirst ? "" : "; the next page: --before " + std::to_string(last)));
    }
}

// What was found: how many rows, and the id of the last one.
struct Found {
    uint64_t rows = 0;
    uint64_t last = 0;
};

Found print(const store::Source& source, const store::Selection& selection, const store::Context& context,
            RecordSink& sink) {
    Found found;
    const auto add = [&](const store::Record& record, bool hit, bool apart) {
        if (apart) {
            sink.gap();
        }
        sink.add(record, hit);
        found.last = hit ? record.id : found.last;
    };
    const auto addAlone = [&](const store::Record& record) { add(record, true, false); };
    const bool alone = context.before == 0 && context.after == 0;
    found.rows = alone ? Select(source, selection, addAlone) : SelectWithContext(source, selection, context, add);
    sink.finish();
    return found;
}

int run(const SearchOptions& options) {
    store::Selection selection = selectionOf(options);
    const store::Context context = contextOf(options);
    const auto source = store::OpenSource(options.db);
    if (options.follow) {
        return follow(options, *source, selection);
    }
    const Style style = options.output.style();
    const bool page = !options.limited && style.format == Format::Table && style.terminal && style.pager.empty();
    if (page) {
        selection.limit = kTableRows;
    }
    Output out(STDOUT_FILENO);
    RecordSink sink(style, shapeOf(options, context), out);
    const Found found = print(*source, selection, context, sink);
    if (page && found.rows == kTableRows) {
        tellMore(*source, selection, found.last);
    }
    return found.rows == 0 ? ReportNothing(WhyNothing(*source, selection, options.filters, options.before)) : kDone;
}

}  // namespace

void AddSearch(CLI::App& app, int& status) {
    AddCommand<SearchOptions>(app, "search", "Print log rows, newest first", status, setup, run);
}

}  // namespace quor::cli
