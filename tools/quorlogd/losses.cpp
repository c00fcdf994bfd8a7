#include "tools/quorlogd/losses.h"

#include <sys/socket.h>
#include <sys/un.h>
#include <syslog.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <fstream>
#include <set>
#include <sstream>
#include <string_view>
#include <vector>

#include "base/guards.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "base/words.h"
#include "store/dates.h"
#include "tools/quorlogd/announce.h"

namespace quor {
namespace {

constexpr const char kUdp[] = "udp ";
constexpr const char kReceiver[] = "syslog-ng ";
const std::string kState = std::string(paths::kRunFolder) + "/quorlogd.losses";

std::string readFile(const std::string& path) {
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

struct Answer {
    std::string text;
    int process = 0;
};

// What syslog-ng answers on its control socket; nothing, with the cause in errno, when it does not.
std::optional<Answer> ask(const std::string& path, const std::string& question) {
    constexpr size_t kMostBytes = 4U << 20U;
    constexpr timeval kPatience{2, 0};
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    Descriptor connection(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!connection || path.size() >= sizeof address.sun_path) {
        return std::nullopt;
    }
    memcpy(address.sun_path, path.c_str(), path.size());
    (void)setsockopt(connection.get(), SOL_SOCKET, SO_SNDTIMEO, &kPatience, sizeof kPatience);
    (void)setsockopt(connection.get(), SOL_SOCKET, SO_RCVTIMEO, &kPatience, sizeof kPatience);
    ucred other{};
    socklen_t size = sizeof other;
    if (connect(connection.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
        getsockopt(connection.get(), SOL_SOCKET, SO_PEERCRED, &other, &size) != 0 ||
        send(connection.get(), question.data(), question.size(), MSG_NOSIGNAL) < 0) {
        return std::nullopt;
    }
    const std::string_view end = "\n.\n";
    Answer answer{"", other.pid};
    std::array<char, 16384> piece{};
    while (answer.text.size() < kMostBytes &&
           (answer.text.size() < end.size() ||
            answer.text.compare(answer.text.size() - end.size(), end.size(), end) != 0)) {
        const ssize_t got = recv(connection.get(), piece.data(), piece.size(), 0);
        if (got <= 0) {
            return std::nullopt;
        }
        answer.text.append(piece.data(), static_cast<size_t>(got));
    }
    return answer;
}

std::vector<std::string> wordsOf(std::string_view line, const char* separators) {
    std::vector<std::string> words;
    EachWord(line, separators, [&](std::string_view word) { words.emplace_back(word); });
    return words;
}

uint64_t increase(uint64_t before, uint64_t now) {
    return now >= before ? now - before : now;
}

}  // namespace

ReceiverCounts ParseReceiverCounts(const std::string& statistics) {
    ReceiverCounts counts;
    EachWord(statistics, "\n", [&](std::string_view line) {
        if (line.rfind("dst.sql;d_quor_database#", 0) != 0) {
            return;
        }
        const size_t number = line.rfind(';');
        const size_t kind = line.rfind(';', number - 1);
        const std::string_view name = line.substr(kind + 1, number - kind - 1);
        const uint64_t value = ToUint64(std::string(line.substr(number + 1)).c_str());
        counts.dropped += name == "dropped" ? value : 0;
        counts.queued += name == "queued" ? value : 0;
        counts.written += name == "written" ? value : 0;
    });
    return counts;
}

// Address and port are the second word, in hexadecimal; the number of the socket is the tenth, its drops the last.
std::map<uint64_t, uint64_t> ParseUdpDrops(const std::string& table, unsigned port) {
    std::map<uint64_t, uint64_t> drops;
    std::array<char, 8> ending{};
    (void)snprintf(ending.data(), ending.size(), ":%04X", port & 0xFFFFU);
    EachWord(table, "\n", [&](std::string_view line) {
        const std::vector<std::string> words = wordsOf(line, " ");
        if (words.size() >= 13 && words[1].size() > 5 && words[1].compare(words[1].size() - 5, 5, ending.data()) == 0) {
            drops[ToUint64(words[9].c_str())] = ToUint64(words[12].c_str());
        }
    });
    return drops;
}

unsigned ReceivingPort() {
    std::set<std::string> files;
    std::error_code none;
    for (const auto& entry : std::filesystem::directory_iterator(paths::kReceiverValues, none)) {
        const std::string name = entry.path().filename();
        if (name.rfind("receiving", 0) == 0 && entry.path().extension() == ".conf") {
            files.insert(entry.path());
        }
    }
    uint64_t port = 514;
    for (const std::string& file : files) {
        EachWord(readFile(file), "\n", [&](std::string_view line) {
            const std::vector<std::string> words = wordsOf(line, " \t\"");
            port = words.size() >= 3 && words[0] == "@define" && words[1] == "quor_port" ? ToUint64(words[2].c_str())
                                                                                         : port;
        });
    }
    return static_cast<unsigned>(port & 0xFFFFU);
}

Losses::Losses(const Options& options) : options_(options) {
    load();
}

void Losses::load() {
    EachWord(readFile(kState), "\n", [&](std::string_view line) {
        const size_t blank = line.rfind(' ');
        if (blank != std::string_view::npos) {
            const std::string number(line.substr(blank + 1));
            totals_[std::string(line.substr(0, blank))] = ToUint64(number.c_str());
        }
    });
    const auto since = totals_.extract("since");
    since_ = since.empty() ? 0 : static_cast<int64_t>(since.mapped());
}

// Where services keep what ends with the machine, as sockets do.
void Losses::save() const {
    std::ostringstream text;
    text << "since " << since_ << '\n';
    for (const auto& [who, count] : totals_) {
        text << who << ' ' << count << '\n';
    }
    std::ofstream(kState) << text.str();  // without it a loss is told again
}

void Losses::lookAtUdp(Totals& totals) const {
    for (const char* table : {"/proc/net/udp", "/proc/net/udp6"}) {
        for (const auto& [socket, drops] : ParseUdpDrops(readFile(table), options_.udpPort)) {
            totals[kUdp + Decimal(socket)] = drops;
        }
    }
}

std::optional<ReceiverCounts> Losses::lookAtReceiver(Totals& totals) {
    const std::optional<Answer> answer = ask(options_.control, "STATS\n");
    if (!answer) {
        if (!complained_) {
            syslog(LOG_WARNING, "Cannot ask syslog-ng at %s what it dropped: %s; set --control to its control socket",
                   options_.control.c_str(), strerror(errno));
        }
        complained_ = true;
        for (const auto& [who, count] : totals_) {
            if (who.rfind(kReceiver, 0) == 0) {
                totals[who] = count;
            }
        }
        return std::nullopt;
    }
    complained_ = false;
    const ReceiverCounts counts = ParseReceiverCounts(answer->text);
    totals[kReceiver + std::to_string(answer->process)] = counts.dropped;
    return counts;
}

void Losses::compare(const Totals& totals) {
    uint64_t kernel = 0;
    uint64_t receiver = 0;
    for (const auto& [who, count] : totals) {
        const auto before = totals_.find(who);
        const uint64_t lost = increase(before == totals_.end() ? 0 : before->second, count);
        (who.rfind(kUdp, 0) == 0 ? kernel : receiver) += lost;
    }
    if (kernel + receiver == 0) {
        return;
    }
    const std::string since = since_ == 0 ? "the start of syslog-ng" : store::LocalTime(since_);
    const std::string details = Decimal(kernel) + " that came over UDP faster than they were taken, " +
                                Decimal(receiver) + " that syslog-ng could not keep";
    RecordEvent("[" + Decimal(kernel + receiver) + "] messages were dropped since " + since + ": " + details);
    SendNotice("QUORSYSLOG_DROPPED",
               {{"%COUNT%", Decimal(kernel + receiver)}, {"%SINCE%", since}, {"%DETAILS%", details}});
}

// Messages wait when there were some at both looks, and none was written in between.
void Losses::watchWaiting(const ReceiverCounts& counts) {
    const bool stuck = counts.queued != 0 && counts_.queued != 0 && counts.written == counts_.written;
    counts_ = counts;
    if (stuck && !stuck_) {
        const std::string since = store::LocalTime(since_);
        RecordEvent("The log database takes no messages since " + since + ", [" + Decimal(counts.queued) + "] wait");
        SendNotice("QUORSYSLOG_WAITING",
                   {{"%COUNT%", Decimal(counts.queued)}, {"%SINCE%", since}, {"%DBPATH%", options_.db}});
    } else if (stuck_ && !stuck) {
        RecordEvent("The log database takes messages again");
    }
    stuck_ = stuck;
}

void Losses::check() {
    Totals totals;
    lookAtUdp(totals);
    if (!options_.control.empty()) {
        if (const std::optional<ReceiverCounts> counts = lookAtReceiver(totals)) {
            watchWaiting(*counts);
        }
    }
    compare(totals);
    totals_ = std::move(totals);
    since_ = time(nullptr);
    save();
}

}  // namespace quor
