#include "tools/quorlogd/losses.h"

#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fstream>
#include <sstream>

#include "base/numbers.h"
#include "base/paths.h"
#include "store/dates.h"
#include "store/receivingvalues.h"
#include "tools/quorlogd/announce.h"

namespace quor {
namespace {

constexpr const char kUdp[] = "udp ";
constexpr const char kReceiver[] = "syslog-ng ";
const std::string kState = std::string(paths::kRunFolder) + "/quorlogd.losses";

uint64_t increase(uint64_t before, uint64_t now) {
    return now >= before ? now - before : now;
}

}  // namespace

Losses::Losses(const Options& options) : options_(options) {
    load();
}

void Losses::load() {
    std::ifstream state(kState);
    for (std::string line; std::getline(state, line);) {
        const size_t blank = line.rfind(' ');
        if (blank != std::string::npos) {
            totals_[line.substr(0, blank)] = ToUint64(line.substr(blank + 1).c_str());
        }
    }
    const auto since = totals_.extract("since");
    since_ = since.empty() ? 0 : static_cast<int64_t>(since.mapped());
}

// Where services keep what ends with the machine, as sockets do. Written after the announcement: when the process dies
// in between, the loss is told twice, which is better than not at all. The file changes whole, so that no other moment
// does.
void Losses::save() const {
    std::ostringstream text;
    text << "since " << since_ << '\n';
    for (const auto& [who, count] : totals_) {
        text << who << ' ' << count << '\n';
    }
    const std::string fresh = kState + ".new";
    const bool written = static_cast<bool>(std::ofstream(fresh) << text.str() << std::flush);
    if (!written || rename(fresh.c_str(), kState.c_str()) != 0) {
        (void)unlink(fresh.c_str());
    }
}

void Losses::lookAtUdp(Totals& totals) const {
    const unsigned port = options_.udpPort != 0 ? options_.udpPort : store::ReadReceivingValues().port;
    for (const auto& [socket, drops] : store::UdpDrops(port)) {
        totals[kUdp + Decimal(socket)] = drops;
    }
}

std::optional<store::ReceiverCounts> Losses::lookAtReceiver(Totals& totals) {
    const std::optional<store::ReceiverCounts> counts = store::AskReceiver(options_.control);
    if (!counts) {
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
    totals[kReceiver + std::to_string(counts->process)] = counts->dropped;
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
void Losses::watchWaiting(const store::ReceiverCounts& counts) {
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
        if (const std::optional<store::ReceiverCounts> counts = lookAtReceiver(totals)) {
            watchWaiting(*counts);
        }
    }
    compare(totals);
    totals_ = std::move(totals);
    since_ = time(nullptr);
    save();
}

}  // namespace quor
