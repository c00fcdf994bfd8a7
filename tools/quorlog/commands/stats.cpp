// stats: what the accounting database knows, and who was heard when.
#include <algorithm>
#include <ctime>

#include "base/paths.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/dates.h"
#include "store/statistics.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

constexpr size_t kWideTerminal = 60;
constexpr int64_t kMostLines = 40;  // that a person gets without saying how long each is

struct StatsOptions {
    std::string db = paths::kAccountingDb;
    OutputOptions output;
    std::string device;
    uint64_t limit = 10;
    std::string last;
    std::string from;
    std::string to;
    std::string every;
};

struct DevicesOptions {
    std::string db = paths::kWorkingDb;
    OutputOptions output;
    uint64_t limit = 0;
};

void setup(CLI::App& command, StatsOptions& options) {
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
}

void setupDevice(CLI::App& command, StatsOptions& options) {
    RefuseEmpty(command.add_option("device", options.device, "Name of the device, as in the column host"))
        ->type_name("NAME")
        ->required();
    setup(command, options);
}

void addSpan(CLI::App& command, StatsOptions& options, const std::string& last) {
    CLI::Option* span = RefuseEmpty(command.add_option("--last", options.last, last))->type_name("SPAN");
    RefuseEmpty(command.add_option("--from,--since", options.from, "First day or second: 6h, 10:00, today, YYYY-MM-DD"))
        ->type_name("TIME")
        ->excludes(span);
    RefuseEmpty(command.add_option("--to,--until", options.to, "Last day or second, inclusive"))
        ->type_name("TIME")
        ->excludes(span);
}

void setupTop(CLI::App& command, StatsOptions& options) {
    setup(command, options);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of devices, 0 for all; 10 by default");
    addSpan(command, options, "Of this time only: 90s, 10m, 6h, 1d");
}

void setupEps(CLI::App& command, StatsOptions& options) {
    setup(command, options);
    addSpan(command, options, "How far to look back: 90s, 10m, 6h, 1d; 10m by default");
    RefuseEmpty(command.add_option("--every", options.every,
                                   "Put samples together: 10s, 1m, 1h; by itself on a terminal when there are many"))
        ->type_name("SPAN");
}

void setupDevices(CLI::App& command, DevicesOptions& options) {
    AddDatabaseOption(command, options.db);
    AddOutputOptions(command, options.output);
    AddNumberOption(command, "-n,--limit", options.limit, "Number of devices, 0 for all");
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

// Without a time, from the first to the last second that there is.
store::TimeSpan spanOf(const StatsOptions& options, const std::string& lastByDefault) {
    const time_t now = time(nullptr);
    const store::Moment from = store::ParseMoment(options.from, "--from", now);
    const store::Moment to = store::ParseMoment(options.to, "--to", now);
    const std::string& last = options.last.empty() ? lastByDefault : options.last;
    if (from.empty() && to.empty()) {
        return {now - static_cast<int64_t>(store::ParseSpan(last, "--last")), now};
    }
    const store::TimeSpan span{from.empty() ? 0 : BeginOf(from), to.empty() ? now : EndOf(to)};
    if (!from.empty() && !to.empty() && span.first > span.last) {
        throw Failure("--from " + options.from + " is after --to " + options.to + "; swap them");
    }
    return span;
}

// Since the beginning.
std::vector<store::DeviceCount> countsOfAll(std::string db, uint64_t limit) {
    std::vector<store::DeviceCount> devices;
    for (const auto& [device, logs] : SyslogDBHistGet(db, static_cast<int>(std::min<uint64_t>(limit, INT32_MAX)))) {
        devices.push_back({device, logs});
    }
    std::stable_sort(devices.begin(), devices.end(), [](const auto& a, const auto& b) { return a.logs > b.logs; });
    return devices;
}

// Samples are kept for a day only.
std::vector<store::DeviceCount> countsOf(const std::string& db, const StatsOptions& options) {
    const store::TimeSpan span = spanOf(options, "");
    const int64_t oldest = store::OldestSample(db);
    if (oldest > span.first) {
        Complain("samples reach back to " + store::LocalTime(oldest) +
                 "; for what is older: quorlog count --by host --from ...");
    }
    return BusiestDevices(db, span, options.limit);
}

int runTop(const StatsOptions& options) {
    const bool spanned = !options.last.empty() || !options.from.empty() || !options.to.empty();
    const std::string db = requireStatistics(options.db, spanned ? "eps" : "histogram");
    const auto devices = spanned ? countsOf(db, options) : countsOfAll(db, options.limit);
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"count", Kind::Number}, {"device"}}, out);
    for (const auto& [device, logs] : devices) {
        sink->row({std::to_string(logs), device});
    }
    sink->finish();
    return devices.empty() ? ReportNothing("no logs were counted") : kDone;
}

// A sample holds what was counted since the one before it closed, so its rate needs that distance, which is not known
// for the first one.
std::vector<store::Stretch> samplesOf(std::string db, const store::TimeSpan& span) {
    const auto bounded = [](int64_t seconds) { return static_cast<int>(std::clamp<int64_t>(seconds, 0, INT32_MAX)); };
    std::vector<store::Stretch> samples;
    for (const auto& [stamp, sample] : SyslogDBEpsGet(db, bounded(span.first), bounded(span.last))) {
        const int64_t seconds = samples.empty() ? 0 : sample.stamp - samples.back().begin;
        samples.push_back({sample.stamp, seconds, sample.eps});
    }
    return samples;
}

// The shortest usual time of which few enough make up the whole.
int64_t stepFor(const std::vector<store::Stretch>& samples) {
    constexpr int64_t kSteps[] = {5, 10, 30, 60, 300, 600, 1800, 3600, 7200, 21600};
    const int64_t seconds = samples.back().begin - samples.front().begin;
    const auto* step =
        std::find_if(std::begin(kSteps), std::end(kSteps), [&](int64_t each) { return seconds / each < kMostLines; });
    return step == std::end(kSteps) ? 86400 : *step;
}

std::vector<store::Stretch> stretchesOf(const StatsOptions& options, const std::string& db,
                                        const store::TimeSpan& span) {
    if (!options.every.empty()) {
        const auto step = static_cast<int64_t>(store::ParseSpan(options.every, "--every"));
        if (step == 0) {
            throw Failure("--every: no time at all; give 10s, 1m or 1h");
        }
        return Stretches(db, span, step);
    }
    const Style style = options.output.style();
    std::vector<store::Stretch> samples = samplesOf(db, span);
    const bool many = static_cast<int64_t>(samples.size()) > kMostLines;
    return many && style.terminal && style.format == Format::Table ? Stretches(db, span, stepFor(samples)) : samples;
}

std::string decimal(double value) {
    char text[32];
    return {text, static_cast<size_t>(snprintf(text, sizeof text, "%.2f", value))};
}

std::vector<std::string> textsOf(const store::Stretch& stretch, bool table) {
    const bool known = stretch.seconds != 0;
    return {table ? store::LocalTime(stretch.begin) : std::to_string(stretch.begin), std::to_string(stretch.logs),
            known ? std::to_string(stretch.seconds) : "",
            known ? decimal(static_cast<double>(stretch.logs) / static_cast<double>(stretch.seconds)) : ""};
}

void writeStretches(const std::vector<store::Stretch>& stretches, const Style& style, Output& out) {
    const bool table = style.format == Format::Table;
    const bool drawn = table && style.terminal;
    const bool narrow = drawn && style.width < kWideTerminal;  // no room for the rates beside the bars
    Columns columns = {{"stamp", table ? Kind::Text : Kind::Number}, {"logs", Kind::Number}};
    if (!narrow) {
        columns.insert(columns.end(), {{"seconds", Kind::Number}, {"per_second", Kind::Number}});
    }
    if (drawn) {
        columns.push_back({"samples"});
    }
    const auto sink = MakeSink(style, columns, out);
    uint64_t largest = 1;
    for (const store::Stretch& stretch : stretches) {
        largest = std::max(largest, stretch.logs);
    }
    for (const store::Stretch& stretch : stretches) {
        std::vector<std::string> texts = textsOf(stretch, table);
        if (narrow) {
            texts = {texts[0].substr(texts[0].find('-') + 1), texts[1]};  // nor for the year
        }
        if (drawn) {
            texts.push_back(Bar(style, stretch.logs, largest));
        }
        sink->row(Cells(texts.begin(), texts.end()));
    }
    sink->finish();
}

int runEps(const StatsOptions& options) {
    const std::string db = requireStatistics(options.db, "eps");
    const store::TimeSpan span = spanOf(options, "10m");
    const std::vector<store::Stretch> stretches = stretchesOf(options, db, span);
    Output out(STDOUT_FILENO);
    writeStretches(stretches, options.output.style(), out);
    return stretches.empty()
               ? ReportNothing("no samples from " + store::LocalTime(span.first) + " to " + store::LocalTime(span.last))
               : kDone;
}

int runDevices(const DevicesOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    std::vector<store::DeviceSeen> devices = store::DevicesSeen(db);
    if (options.limit != 0 && devices.size() > options.limit) {
        devices.resize(static_cast<size_t>(options.limit));
    }
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(options.output.style(), {{"last"}, {"first"}, {"rows", Kind::Number}, {"device"}}, out);
    for (const store::DeviceSeen& seen : devices) {
        sink->row({seen.last, seen.first, std::to_string(seen.rows), seen.device});
    }
    sink->finish();
    return devices.empty() ? ReportNothing("no rows in " + db) : kDone;
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
    AddCommand<DevicesOptions>(stats, "devices", "Print when each device was heard first and last", status,
                               setupDevices, runDevices);
}

}  // namespace quor::cli
