#include "tools/quorlogd/receiver.h"

#include <sys/statvfs.h>
#include <syslog.h>

#include <cinttypes>
#include <filesystem>
#include <thread>

#include "base/paths.h"
#include "logger.h"
#include "tools/quorlogd/noticetext.h"

namespace quor {
namespace {

using Clock = std::chrono::steady_clock;

constexpr unsigned long long kFlushNeedsBytes = 4ULL * 1024 * 1024;

// A full volume may fail a transaction only at its very end, when the samples count as written: none is begun then.
bool hasRoomToFlush() {
    const std::string folder = std::filesystem::path(paths::kAccountingDb).parent_path();
    struct statvfs volume {};
    return statvfs(folder.c_str(), &volume) != 0 ||  // the flush finds out what is wrong
           static_cast<unsigned long long>(volume.f_bavail) * volume.f_frsize >= kFlushNeedsBytes;
}

// A notice about our own trouble with notices would set off the next one.
bool isOwnLog(const _SYSLOG_LOG_DATA_tag& record) {
    return record.prog == "quorlogd" && record.ip == "127.0.0.1";
}

}  // namespace

Receiver::Receiver(const Options& options)
    : maxWaiting_(options.maxWaiting), splitter_(options.maxLineBytes), budget_(options.noticesPerMinute, Clock::now()),
      devices_(options.maxDevices) {
    for (const QUORLOG_LOG_DEVICE_STATISTIC& row : accounting_.HistogramGet()) {
        (void)devices_.admit(row.device);
    }
}

void Receiver::take(std::string_view chunk) {
    splitter_.feed(chunk, [this](const std::string& line) { takeLine(line); });
}

void Receiver::takeLine(const std::string& line) {
    ++counters_.lines;
    if (parser_.ParseSingleEntry(line, record_) < 0) {
        ++counters_.bad;
        return;
    }
    (void)accounting_.LogInc(devices_.admit(record_.host));  // cannot fail
    checkRules(record_);
}

void Receiver::checkRules(const _SYSLOG_LOG_DATA_tag& record) {
    const bool severe = rules_.CheckSev(record.prio);
    const std::string keyword = rules_.CheckKeyword(record.msg);
    if ((!severe && keyword.empty()) || isOwnLog(record)) {
        return;
    }
    // The calls report their own failures.
    const std::string content = FitForNotice(record.msg);
    if (severe && mayNotify()) {
        (void)rules_.NotificationSendSev(record.host, PriorTypeToStr(record.prio), content);
        (void)Logger().LogAddNotifySev(record.prio, EventText(content));
    }
    if (!keyword.empty() && mayNotify()) {
        (void)rules_.NotificationSendKeyword(record.host, keyword, content);
        (void)Logger().LogAddNotifyKw(EventText(keyword), EventText(content));
    }
}

bool Receiver::mayNotify() {
    const bool granted = budget_.take(Clock::now());
    ++(granted ? counters_.notices : counters_.suppressed);
    return granted;
}

bool Receiver::flush() {
    if (hasRoomToFlush() && accounting_.AccoutingFlush2DB() == 0) {
        return true;
    }
    ++counters_.failedFlushes;
    const unsigned long long forgotten = accounting_.EpsListTrim(maxWaiting_);
    counters_.forgottenSamples += forgotten;
    syslog(LOG_WARNING, "Accounting is kept in memory until %s can be written; %llu samples were dropped",
           paths::kAccountingDb, forgotten);
    return false;
}

void Receiver::closeSample() {
    constexpr int kTries = 200;  // a sample ends with its second
    for (int i = 0; i < kTries && accounting_.CurrentEpsGet() != 0; ++i) {
        tick();
        std::this_thread::sleep_for(std::chrono::milliseconds(accounting_.CurrentEpsGet() != 0 ? 10 : 0));
    }
}

void Receiver::finish() {
    splitter_.finish([this](const std::string& line) { takeLine(line); });
    closeSample();
    (void)flush();
    reportBadLines();
}

void Receiver::reloadRules() {
    rules_ = NotificationManager();
    accounting_.RulesReload();
}

void Receiver::reportBadLines() {
    const uint64_t fresh = counters_.bad - counters_.badReported;
    counters_.badReported = counters_.bad;
    if (fresh != 0) {
        syslog(LOG_WARNING, "%" PRIu64 " lines were not log entries: check the template of the destination", fresh);
    }
}

std::string Receiver::statistics() const {
    const std::pair<const char*, uint64_t> figures[] = {
        {" lines, ", counters_.lines},
        {" bad, ", counters_.bad},
        {" oversized, ", splitter_.oversized()},
        {" devices, ", devices_.count()},
        {" notices, ", counters_.notices},
        {" notices suppressed, ", counters_.suppressed},
        {" flushes failed, ", counters_.failedFlushes},
        {" samples dropped", counters_.forgottenSamples},
    };
    std::string text;
    for (const auto& [name, figure] : figures) {
        text += std::to_string(figure) + name;
    }
    return text;
}

}  // namespace quor
