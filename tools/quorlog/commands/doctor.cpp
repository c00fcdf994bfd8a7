// doctor: what is wrong with receiving, following, space and notices, and what to do about it.
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <functional>
#include <map>
#include <optional>

#include "base/files.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "store/ask.h"
#include "store/channels.h"
#include "store/connections.h"
#include "store/counted.h"
#include "store/databasefile.h"
#include "store/dates.h"
#include "store/receiving.h"
#include "store/receivingvalues.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct DoctorOptions {
    std::string db = paths::kWorkingDb;
    std::string control = paths::kReceiverControl;
    std::string format = "table";
};

enum class State { Good, Doubtful, Bad };

// One thing looked at. The measures have names and values as Prometheus wants them.
struct Finding {
    const char* check;
    State state;
    std::string detail;
    std::string advice;
    std::vector<std::pair<const char*, uint64_t>> measures;
};

void setup(CLI::App& command, DoctorOptions& options) {
    AddDatabaseOption(command, options.db);
    command.add_option("--control", options.control, "Control socket of syslog-ng")
        ->type_name("PATH")
        ->capture_default_str();
    command.add_option("--format", options.format, "Output format: table, json, csv, ndjson, prometheus")
        ->type_name("NAME")
        ->capture_default_str()
        ->check(CLI::IsMember({"table", "json", "csv", "ndjson", "prometheus"}));
}

Finding lookAtReceiver(const std::string& control) {
    const std::optional<store::ReceiverCounts> counts = store::AskReceiver(control);
    if (!counts && errno == EACCES) {
        return {"syslog-ng", State::Doubtful, "may not be asked at " + control, "run as root to hear its counts", {}};
    }
    if (!counts) {
        return {"syslog-ng",
                State::Bad,
                std::string("does not answer at ") + control + ": " + strerror(errno),
                "start it, or name its control socket with --control",
                {{"receiver_up", 0}}};
    }
    if (!counts->stores) {
        return {"syslog-ng",
                State::Bad,
                "runs as process " + std::to_string(counts->process) + ", but stores nothing in a log database",
                "see that quorsyslog.conf is linked from /etc/syslog-ng/conf.d, and restart it",
                {{"receiver_up", 1}}};
    }
    const bool waiting = counts->queued > 1000;
    const bool lost = counts->dropped != 0;
    return {"syslog-ng",
            lost || waiting ? State::Doubtful : State::Good,
            "runs as process " + std::to_string(counts->process) + "; " + Decimal(counts->written) +
                " messages written, " + Decimal(counts->queued) + " waiting, " + Decimal(counts->dropped) +
                " dropped since its start",
            lost      ? "see its messages in the system log; most often its disk was full"
            : waiting ? "see whether the log database can be written"
                      : "",
            {{"receiver_up", 1},
             {"messages_written", counts->written},
             {"messages_waiting", counts->queued},
             {"messages_dropped", counts->dropped}}};
}

Finding lookAtUdp() {
    const unsigned port = store::ReadReceivingValues().port;
    const std::map<uint64_t, uint64_t> drops = store::UdpDrops(port);
    uint64_t dropped = 0;
    for (const auto& [socket, count] : drops) {
        dropped += count;
    }
    const std::string name = "UDP port " + std::to_string(port);
    if (drops.empty()) {
        return {"udp", State::Bad, name + " is not open", "see the messages of syslog-ng in the system log", {}};
    }
    return {"udp",
            dropped == 0 ? State::Good : State::Doubtful,
            name + " is open; " + Decimal(dropped) + " datagrams dropped since then",
            dropped == 0 ? "" : "let devices that send much use TCP",
            {{"datagrams_dropped", dropped}}};
}

Finding lookAtTcp() {
    const store::ReceivingValues values = store::ReadReceivingValues();
    const std::map<uint16_t, store::PortUse> uses = store::UseOfPorts(values.tcpPorts());
    Finding finding{"tcp", State::Good, "", "", {}};
    uint64_t connections = 0;
    for (const uint16_t port : values.tcpPorts()) {
        const auto use = uses.find(port);
        finding.detail += (finding.detail.empty() ? "port " : "; port ") + std::to_string(port);
        if (use == uses.end()) {
            finding.detail += " is not open";
            finding.state = State::Bad;
            finding.advice = "see the messages of syslog-ng in the system log";
            continue;
        }
        connections += use->second.connections;
        finding.detail +=
            " has " + Decimal(use->second.connections) + " of " + Decimal(values.connections) + " connections";
        if (store::IsCrowded(use->second, values.connections) && finding.state == State::Good) {
            finding.detail += ", " + Decimal(use->second.busiestHolds) + " of them from " + use->second.busiest;
            finding.state = State::Doubtful;
            finding.advice =
                "see what that device does; systemctl enable --now quorsyslog-connections bounds each address";
        }
    }
    finding.measures = {{"tcp_connections", connections}};
    return finding;
}

// Rows that were received and are not counted; those put there from another database never are.
uint64_t rowsBehind(const store::Source& source, uint64_t position) {
    const uint64_t newest = store::NewestReceived(source);
    uint64_t behind = newest > position ? newest - position : 0;
    for (const store::IdRange& range : source.brought(position)) {
        const uint64_t first = std::max(range.first, position + 1);
        const uint64_t last = std::min(range.last, newest);
        behind -= last >= first ? std::min(behind, last - first + 1) : 0;
    }
    return behind;
}

// Before the first message it has no tables.
bool isNew(const std::string& db) {
    return store::Ask(db, "SELECT 1 FROM sqlite_schema WHERE name = 'logs'", "1").empty();
}

Finding lookAtFollower(const std::string& db) {
    if (store::FollowerProcess() == 0) {
        return {"quorlogd",
                State::Bad,
                "does not run: nothing is counted, judged or announced",
                "start it; the system log tells why it ended",
                {{"follower_up", 0}}};
    }
    if (access(db.c_str(), F_OK) != 0) {
        return {"quorlogd", State::Doubtful, "runs, and waits for " + db, "start syslog-ng", {{"follower_up", 1}}};
    }
    const auto source = store::OpenSource(db);
    if (isNew(db)) {
        return {"quorlogd", State::Good, "runs, and waits for the first message", "", {{"follower_up", 1}}};
    }
    const std::optional<uint64_t> position = store::CountedUpTo(*source);
    const uint64_t behind = rowsBehind(*source, position.value_or(0));
    const bool late = (!position && behind != 0) || behind > 50000;
    return {"quorlogd",
            late ? State::Doubtful : State::Good,
            position || !late ? "runs; " + Decimal(behind) + " rows are not written to its counts yet"
                              : "runs, but has not counted this database yet",
            late ? "wait; if it stays so, see its messages in the system log" : "",
            {{"follower_up", 1}, {"rows_behind", behind}}};
}

Finding lookAtRows(const store::Source& source, const std::string& db) {
    store::Record last;
    if (isNew(db) || source.read("logs", {}, {1, 0}, false, [&](const store::Record& record) { last = record; }) == 0) {
        return {"rows",
                State::Doubtful,
                "no message was stored yet",
                "send one: logger -n 127.0.0.1 -d -P " + std::to_string(store::ReadReceivingValues().port) + " hello",
                {{"last_row_id", 0}}};
    }
    const int64_t second = last.rsec != 0 ? last.rsec : last.utcsec;
    const std::string when = second != 0 ? store::LocalTime(second) : last.ldate + " " + last.ltime;
    const int64_t age = static_cast<int64_t>(time(nullptr)) - second;
    const bool future = age < -60;
    return {"rows",
            future || age > 86400 ? State::Doubtful : State::Good,
            "the last, " + Decimal(last.id) + ", came from " + last.host + " at " + when,
            future        ? "its time is still to come: set the clock of this machine right"
            : age > 86400 ? "no message for a day: see that the devices send to this machine"
                          : "",
            {{"last_row_id", last.id}, {"last_row_seconds", static_cast<uint64_t>(std::max<int64_t>(second, 0))}}};
}

// Whether the header is one, and the file as long as it says. A checkpoint may just be making it longer.
std::string wrongHeader(const std::string& db) {
    constexpr size_t kHeader = 100;
    constexpr useconds_t kMoment = 50000;
    const Descriptor file(open(db.c_str(), O_RDONLY | O_CLOEXEC));
    for (int tried = 0; tried < 2; ++tried) {
        std::array<unsigned char, kHeader> header{};
        if (ReadAt(file, 0, header.data(), kHeader) != kHeader || memcmp(header.data(), "SQLite format 3", 16) != 0) {
            return store::SizeOf(db) == 0 ? "" : "its header is not that of a database";
        }
        const uint64_t pageSize = header[16] == 0 && header[17] == 1 ? 65536 : header[16] * 256U + header[17];
        const uint64_t pages = ((header[28] * 256ULL + header[29]) * 256 + header[30]) * 256 + header[31];
        if (pages * pageSize <= store::SizeOf(db)) {
            return "";
        }
        (void)usleep(kMoment);
    }
    return "its file is shorter than its header says";
}

// Rows all over the table, each on a page of its own: few enough not to keep a slow disk busy.
void readHereAndThere(const std::string& db) {
    constexpr int kPlaces = 12;
    const Connection connection = store::Connect(db);
    for (int place = 0; place <= kPlaces; ++place) {
        (void)store::Execute(
            connection, db,
            "SELECT * FROM logs WHERE id >= (SELECT min(id) FROM logs) + ((SELECT max(id) FROM logs) - "
            "(SELECT min(id) FROM logs)) / " +
                std::to_string(kPlaces) + " * " + std::to_string(place) + " ORDER BY id LIMIT 1");
    }
}

Finding lookAtFile(const std::string& db) {
    std::string wrong = wrongHeader(store::RequireLogDatabase(db));
    try {
        readHereAndThere(db);
    } catch (const Failure& failure) {
        if (failure.cause() == store::Cause::Damaged) {
            wrong = failure.what();
        } else if (failure.cause() != store::Cause::Missing) {
            throw;
        }
    }
    return {"database",
            wrong.empty() ? State::Good : State::Bad,
            wrong.empty() ? "its header and places all over it are sound; quorlog db check looks at everything" : wrong,
            wrong.empty() ? "" : "quorlog db check --db " + db + " tells more",
            {}};
}

Finding lookAtSpace(const std::string& db) {
    struct statvfs volume {};
    const std::string folder = std::filesystem::path(db).parent_path();
    if (statvfs(folder.c_str(), &volume) != 0) {
        return {"space", State::Bad, folder + ": " + strerror(errno), "create it, and start syslog-ng", {}};
    }
    const uint64_t left = static_cast<uint64_t>(volume.f_bavail) * volume.f_frsize;
    const uint64_t size = store::SizeOf(db);
    const uint64_t journal = store::SizeOf(db + "-wal");
    const uint64_t mega = uint64_t{1} << 20;
    const bool full = left < 64 * mega;
    const bool soon = left < 512 * mega || journal > 256 * mega;
    return {"space",
            full   ? State::Bad
            : soon ? State::Doubtful
                   : State::Good,
            "the database takes " + Decimal(size / mega) + " MiB, its write-ahead log " + Decimal(journal / mega) +
                " MiB; " + Decimal(left / mega) + " MiB are left",
            full || left < 512 * mega ? "delete old rows, or move the logs to a larger disk"
            : soon                    ? "quorlog db checkpoint, with syslog-ng stopped, moves the log into the database"
                                      : "",
            {{"database_bytes", size}, {"journal_bytes", journal}, {"free_bytes", left}}};
}

Finding lookAtNotices() {
    if (access(paths::kSystemSettings, R_OK) != 0 && errno == EACCES) {
        return {"notices",
                State::Doubtful,
                std::string("may not read ") + paths::kSystemSettings,
                "run as root to hear whether a channel is set up",
                {}};
    }
    const bool set = store::IsChannelSet();
    return {"notices",
            set ? State::Good : State::Doubtful,
            set ? "a channel is set up" : "no channel is set up: matches of the rules are events only",
            set ? "" : std::string("set one up in ") + paths::kSystemSettings + ", then: quorlog notify test",
            {}};
}

// A check that cannot be made is a finding, too.
Finding guarded(const char* check, const std::function<Finding()>& look) {
    try {
        return look();
    } catch (const Failure& failure) {
        return {check, State::Bad, failure.what(), "", {}};
    }
}

std::vector<Finding> examine(const DoctorOptions& options) {
    const std::string db = store::AbsolutePath(options.db);
    std::vector<Finding> findings = {lookAtReceiver(options.control), lookAtUdp(), lookAtTcp()};
    findings.push_back(guarded("quorlogd", [&] { return lookAtFollower(db); }));
    findings.push_back(guarded("rows", [&] { return lookAtRows(*store::OpenSource(db), db); }));
    findings.push_back(guarded("database", [&] { return lookAtFile(db); }));
    findings.push_back(lookAtSpace(db));
    findings.push_back(lookAtNotices());
    return findings;
}

const char* nameOf(State state) {
    constexpr const char* kNames[] = {"good", "look", "bad"};
    return kNames[static_cast<size_t>(state)];
}

void writeMetrics(const std::vector<Finding>& findings) {
    for (const Finding& finding : findings) {
        WriteLine(std::string("quorsyslog_check{name=\"") + finding.check + "\"} " +
                  std::to_string(static_cast<int>(finding.state)));
        for (const auto& [name, value] : finding.measures) {
            WriteLine(std::string("quorsyslog_") + name + " " + Decimal(value));
        }
    }
}

void writeTable(const std::string& format, const std::vector<Finding>& findings) {
    OutputOptions output;
    output.format = format;
    output.noPager = true;
    Output out(STDOUT_FILENO);
    const auto sink = MakeSink(output.style(), {{"check"}, {"state"}, {"found"}, {"advice"}}, out);
    for (const Finding& finding : findings) {
        sink->row({finding.check, nameOf(finding.state), finding.detail, finding.advice});
    }
    sink->finish();
}

int run(const DoctorOptions& options) {
    const std::vector<Finding> findings = examine(options);
    if (options.format == "prometheus") {
        writeMetrics(findings);
        return kDone;
    }
    writeTable(options.format, findings);
    State worst = State::Good;
    for (const Finding& finding : findings) {
        worst = std::max(worst, finding.state);
    }
    return static_cast<int>(worst);  // 0, 1 and 2, as everywhere
}

}  // namespace

void AddDoctor(CLI::App& app, int& status) {
    AddCommand<DoctorOptions>(app, "doctor", "Say whether logs are received, counted and announced", status, setup,
                              run);
}

}  // namespace quor::cli
