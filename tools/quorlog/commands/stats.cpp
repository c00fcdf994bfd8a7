// stats total, device, top, eps: what the accounting database knows.
#include <algorithm>
#include <ctime>

#include "base/paths.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/dates.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

constexpr size_t kBarWidth = 40;

struct StatsOptions {
    std::string db = paths::kAccountingDb;
    OutputOptions output;
    std::string device;
    uint64_t limit = 10;
    std::string last = "10m";
    std::string from;
    std::string to;
};

void setup(CLI::App& command, StatsOptions& options) {
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
}

void setupDevice(CLI::App& command, StatsOptions& options) {
    command.add_option("device", options.device, "Name of the device, as in the column host")
        ->type_name("NAME")
        ->required();
    setup(command, options);
}

void setupTop(CLI::App& command, StatsOptions& options) {
    setup(command, options);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of devices, 0 for all; 10 by default");
}

void setupEps(CLI::App& command, StatsOptions& options) {
    setup(command, options);
    CLI::Option* last = command.add_option("--last", options.last, "How far to look back: 90s, 10m, 6h, 2d");
    last->type_name("SPAN")->capture_default_str();
    command.add_option("--from", options.from, "First day, instead of --last: YYYY-MM-DD, today, yesterday, 7d")
        ->type_name("DATE")
        ->excludes(last);
    command.add_option("--to", options.to, "Last day")->type_name("DATE")->excludes(last);
}

// The readers of the library give 0 and nothing for a database that they cannot read.
std::string requireStatistics(const std::string& path, const char* table) {
    std::string db = store::RequireDatabase(path, "start quorlogd, which writes it, or give another --db");
    store::RequireTable(db, table);
    return db;
}

int writeCount(const StatsOptions& options, const std::string& device, uint64_t count) {
    Output out(STDOUT_FILENO);
    std::vector<Value> values = {{"count", std::to_string(count), Kind::Number}};
    if (!device.empty()) {
        values.insert(values.begin(), {"device", device});
    }
    WriteRecord(options.output.style(), values, out);
    return count == 0 ? ReportNothing("no logs were counted") : kDone;
}

int runTotal(const StatsOptions& options) {
    std::string db = requireStatistics(options.db, "histogram");
    return writeCount(options, "", SyslogDBHistTotalGet(db));
}

// The library puts the name between single quotes as it stands.
std::string quoted(const std::string& name) {
    std::string out;
    for (const char c : name) {
        out.append(c == '\'' ? 2 : 1, c);
    }
    return out;
}

int runDevice(const StatsOptions& options) {
    std::string db = requireStatistics(options.db, "histogram");
    return writeCount(options, options.device, SyslogDBHistGetSingle(db, quoted(options.device)));
}

int runTop(const StatsOptions& options) {
    std::string db = requireStatistics(options.db, "histogram");
    const auto counts = SyslogDBHistGet(db, static_cast<int>(std::min<uint64_t>(options.limit, INT32_MAX)));
    std::vector<std::pair<std::string, unsigned long long>> sorted(counts.begin(), counts.end());
    std::stable_sort(sorted.begin(), sorted.end(), [](const auto& a, const auto& b) { return a.second > b.second; });
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"count", Kind::Number}, {"device"}}, out);
    for (const auto& [device, count] : sorted) {
        sink->row({std::to_string(count), device});
    }
    sink->finish();
    return sorted.empty() ? ReportNothing("no logs were counted") : kDone;
}

struct Span {
    int64_t first;
    int64_t last;
};

Span spanOf(const StatsOptions& options) {
    const time_t now = time(nullptr);
    const store::Moment from = store::ParseMoment(options.from, "--from", now);
    const store::Moment to = store::ParseMoment(options.to, "--to", now);
    if (from.empty() && to.empty()) {
        return {now - static_cast<int64_t>(store::ParseSpan(options.last, "--last")), now};
    }
    const Span span{from.empty() ? 0 : BeginOf(from), to.empty() ? now : EndOf(to)};
    if (!from.empty() && !to.empty() && span.first > span.last) {
        throw Failure("--from " + options.from + " is after --to " + options.to + "; swap them");
    }
    return span;
}

int bounded(int64_t seconds) {
    return static_cast<int>(std::clamp<int64_t>(seconds, 0, INT32_MAX));
}

std::string decimal(double value) {
    char text[32];
    return {text, static_cast<size_t>(snprintf(text, sizeof text, "%.2f", value))};
}

using Samples = std::map<int32_t, SYSLOG_LOG_EPS>;

unsigned long long largestOf(const Samples& samples) {
    unsigned long long largest = 1;
    for (const auto& [stamp, sample] : samples) {
        largest = std::max(largest, sample.eps);
    }
    return largest;
}

// A sample holds what was counted since the one before it closed, so its rate needs that distance: 0 is an unknown one,
// as that of the first sample shown.
std::vector<std::string> textsOf(const SYSLOG_LOG_EPS& sample, int64_t seconds, bool table) {
    const bool known = seconds != 0;
    return {table ? store::LocalTime(sample.stamp) : std::to_string(sample.stamp), std::to_string(sample.eps),
            known ? std::to_string(seconds) : "",
            known ? decimal(static_cast<double>(sample.eps) / static_cast<double>(seconds)) : ""};
}

void writeSamples(const Samples& samples, const Style& style, Output& out) {
    const bool table = style.format == Format::Table;
    const bool drawn = table && style.terminal;
    Columns columns = {{"stamp", table ? Kind::Text : Kind::Number},
                       {"logs", Kind::Number},
                       {"seconds", Kind::Number},
                       {"per_second", Kind::Number}};
    if (drawn) {
        columns.push_back({"samples"});
    }
    const auto sink = MakeSink(style, columns, out);
    const unsigned long long largest = largestOf(samples);
    long long previous = samples.empty() ? 0 : samples.begin()->second.stamp;
    for (const auto& [stamp, sample] : samples) {
        std::vector<std::string> texts = textsOf(sample, sample.stamp - previous, table);
        if (drawn) {
            texts.emplace_back(sample.eps * kBarWidth / largest, '#');
        }
        sink->row(Cells(texts.begin(), texts.end()));
        previous = sample.stamp;
    }
    sink->finish();
}

int runEps(const StatsOptions& options) {
    std::string db = requireStatistics(options.db, "eps");
    const Span span = spanOf(options);
    const auto samples = SyslogDBEpsGet(db, bounded(span.first), bounded(span.last));
    Output out(STDOUT_FILENO);
    writeSamples(samples, options.output.style(), out);
    return samples.empty()
               ? ReportNothing("no samples from " + store::LocalTime(span.first) + " to " + store::LocalTime(span.last))
               : kDone;
}

}  // namespace

void AddStats(CLI::App& app, int& status) {
    CLI::App& stats = *app.add_subcommand("stats", "Statistics of the received logs");
    stats.require_subcommand(1);
    AddCommand<StatsOptions>(stats, "total", "Print how many logs were counted", status, setup, runTotal);
    AddCommand<StatsOptions>(stats, "device", "Print how many logs came from one device", status, setupDevice,
                             runDevice);
    AddCommand<StatsOptions>(stats, "top", "Print the devices with the most logs", status, setupTop, runTop);
    AddCommand<StatsOptions>(stats, "eps", "Print samples of the log rate", status, setupEps, runEps);
}

}  // namespace quor::cli
