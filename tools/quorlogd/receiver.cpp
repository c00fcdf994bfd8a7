#include "tools/quorlogd/receiver.h"

#include <sys/stat.h>
#include <sys/statvfs.h>
#include <syslog.h>

#include <cstring>
#include <ctime>
#include <filesystem>
#include <utility>

#include "base/numbers.h"
#include "base/paths.h"
#include "common/handles.h"
#include "dbhandler.h"
#include "logger.h"
#include "store/ask.h"
#include "store/channels.h"
#include "store/event.h"
#include "store/failure.h"
#include "tools/quorlogd/announce.h"
#include "tools/quorlogd/noticetext.h"

namespace quor {
namespace {

using Clock = std::chrono::steady_clock;
using store::Cause;
using store::Failure;

constexpr unsigned long long kFlushNeedsBytes = 4ULL * 1024 * 1024;
constexpr const char kSeverity[] = "QUORSYSLOG_SEV_EXCEED";
constexpr const char kKeyword[] = "QUORSYSLOG_KEYWORD_MATCH";

// A full volume may fail a transaction only at its very end: none is begun then.
bool hasRoomToFlush() {
    const std::string folder = std::filesystem::path(paths::kAccountingDb).parent_path();
    struct statvfs volume {};
    return statvfs(folder.c_str(), &volume) != 0 ||  // the flush finds out what is wrong
           static_cast<unsigned long long>(volume.f_bavail) * volume.f_frsize >= kFlushNeedsBytes;
}

// A notice about our own trouble with notices would set off the next one.
bool isOwnLog(const store::Record& record) {
    return record.prog == "quorlogd" &&
           (record.ip == "127.0.0.1" || record.ip == "::1" || record.ip == "::ffff:127.0.0.1");
}

// The second in which the row was received; of former versions only the sender's is known.
int64_t secondOf(const store::Record& record) {
    return record.rsec != 0 ? record.rsec : record.utcsec;
}

// The filter's least seconds between two notices of a kind.
int32_t intervalOf(const char* kind) {
    StringTable section(QLIBCSzHashAlloc(16));
    const bool read = QLIBCFileGetSection(paths::kNotifyFilter, kind, Adopt(section)) >= 0;
    return read ? ToInt32(QLIBCSzHashGetValue(section.get(), "interval")) : 0;
}

// 0 when there is no such file.
ino_t inodeOf(const std::string& path) {
    struct stat found {};
    return stat(path.c_str(), &found) == 0 ? found.st_ino : 0;
}

// Whether a former version counted rows, and kept no position.
bool isCountedWithoutPosition() {
    return !store::Ask(paths::kAccountingDb,
                       "SELECT 1 FROM histogram WHERE NOT EXISTS (SELECT 1 FROM followed) LIMIT 1", "1")
                .empty();
}

}  // namespace

Receiver::Receiver(const Options& options)
    : options_(options), source_(store::ExpectSource(options.db)),
      follower_(*source_, {}, [this](const std::string& identity) { return start(identity); }),
      alarms_(options.noticesPerMinute, Clock::now()), devices_(options.maxDevices), ruleWatch_(options, alarms_) {
    for (const QUORLOG_LOG_DEVICE_STATISTIC& row : accounting_.HistogramGet()) {
        devices_.know(row.device);
    }
    reloadRules();
}

// Where the rows of a database go on. Whatever is not known for certain is a Failure, and asked again: a guess would
// count rows twice, or not at all.
uint64_t Receiver::start(const std::string& identity) {
    (void)accounting_.RowsUpdate(INT64_MAX);  // cannot fail
    if (!follower_.identity().empty() && !flush()) {
        throw Failure("the rows of the former database wait to be written", Cause::Busy);
    }
    if (!store::HasIdentity(identity)) {
        store::GiveIdentity(options_.db);
        throw Failure("the database has got its identity", Cause::Busy);
    }
    unsigned long long last = 0;
    judged_ = 0;
    const int known = accounting_.RowsPositionGet(identity, last, judged_);
    if (known < 0) {
        throw Failure(std::string("the position in ") + paths::kAccountingDb + " cannot be read", Cause::Other);
    }
    const bool adopted = known == 0 && isCountedWithoutPosition();
    if (adopted) {
        last = judged_ = LargestId(*source_, "logs");
    }
    accounting_.RowsPositionSet(last);
    if (adopted && accounting_.RowsFlush2DB(identity, judged_) < 0) {
        throw Failure(std::string(paths::kAccountingDb) + " cannot be written", Cause::Other);
    }
    return last;
}

bool Receiver::takeRows() {
    if (accounting_.RowsWaiting() > options_.maxWaiting && !flush()) {
        return false;
    }
    try {
        const bool more = follower_.poll([this](const store::Record& record) { take(record); });
        if (matched_) {
            (void)flush();  // so that a crash repeats no notice
        }
        report("");
        damagedLooks_ = 0;
        caughtUp_ = !more;
        return more;
    } catch (const Failure& failure) {
        report(failure.what());
        if (failure.cause() == Cause::Damaged) {
            replaceDamaged();
        }
        return false;
    }
}

// syslog-ng cannot write it either: what it receives waits until there is a new one. A database that is just being put
// in place may look damaged for a moment. Its companions go along: rows in them can be saved, and the new one must not
// find them.
void Receiver::replaceDamaged() {
    constexpr unsigned kSureAfter = 3;
    constexpr unsigned kAgainAfter = 60;
    if (++damagedLooks_ % kAgainAfter != kSureAfter) {
        return;
    }
    const std::string aside = options_.db + ".corrupt";
    const ino_t damaged = inodeOf(options_.db);
    for (const char* companion : {"-wal", "-shm"}) {
        (void)remove((aside + companion).c_str());
        (void)rename((options_.db + companion).c_str(), (aside + companion).c_str());
    }
    (void)DBErrorHandle_SQLITE_CORRUPT(nullptr, options_.db);  // reports its own failures
    RecordEvent(damaged != 0 && inodeOf(aside) == damaged
                    ? "The log database was damaged: it is kept as " + aside + ", and a new one begins"
                    : "The log database is damaged, and could not be moved aside: " + options_.db);
}

// Once for each trouble, not with every look.
void Receiver::report(const std::string& trouble) {
    if (!trouble.empty() && trouble != trouble_) {
        syslog(LOG_WARNING, "Waiting for %s: %s", options_.db.c_str(), trouble.c_str());
    }
    trouble_ = trouble;
}

void Receiver::take(const store::Record& record) {
    constexpr int64_t kDay = 86400;
    ++counters_.rows;
    const int64_t second = secondOf(record);
    const std::string& device = devices_.admit(record.host, record.ip, second / kDay);
    (void)accounting_.RowInc(device, second, record.id);  // cannot fail
    if (record.id > judged_) {
        judge(record, device);
        judged_ = record.id;
    }
}

// A number, such as the process id, would match too much.
std::string Receiver::keywordIn(const store::Record& record) {
    for (const std::string* text : {&record.msg, &record.msgid, &record.sdata}) {
        std::string keyword = rules_.CheckKeyword(*text);
        if (!keyword.empty()) {
            return keyword;
        }
    }
    return "";
}

void Receiver::judge(const store::Record& record, const std::string& device) {
    const int64_t second = record.rsec != 0 ? record.rsec : time(nullptr);  // never what a sender claims
    ruleWatch_.hear(record, device, second);
    if (isOwnLog(record)) {
        return;
    }
    const bool severe = rules_.CheckSev(record.prio);
    const std::string keyword = keywordIn(record);
    bool announced = ruleWatch_.match(record, device, second);
    // The calls report their own failures.
    if (severe && alarms_.grant(kSeverity, device, Clock::now())) {
        announced = true;
        (void)rules_.NotificationSendSev(record.host, PriorTypeToStr(record.prio), ContentOf(record));
        (void)Logger().LogAddNotifySev(record.prio, store::EventText(record.host + ": " + ContentOf(record)));
    }
    if (!keyword.empty() && alarms_.grant(kKeyword, device, Clock::now())) {
        announced = true;
        (void)rules_.NotificationSendKeyword(record.host, keyword, ContentOf(record, keyword));
        (void)Logger().LogAddNotifyKw(store::EventText(keyword),
                                      store::EventText(record.host + ": " + ContentOf(record, keyword)));
    }
    if (announced) {
        matched_ = true;
        tellChannels();
    }
}

// Once after each reading of the rules: who set them should not wait for notices that cannot come.
void Receiver::tellChannels() {
    if (!std::exchange(channelsTold_, true) && !store::IsChannelSet()) {
        const std::string text = std::string("A rule matched, but no channel for notices is set up in ") +
                                 paths::kSystemSettings + ": matches become events only";
        syslog(LOG_WARNING, "%s", text.c_str());
        RecordEvent(text);
    }
}

// Rows of a second may come a moment after it.
void Receiver::tick() {
    if (caughtUp_) {
        (void)accounting_.RowsUpdate(time(nullptr) - 1);  // cannot fail
    }
    ruleWatch_.tick(caughtUp_ && trouble_.empty());
}

bool Receiver::flush() {
    if (hasRoomToFlush() && accounting_.RowsFlush2DB(follower_.identity(), judged_) == 0) {
        matched_ = false;
        return true;
    }
    ++counters_.failedFlushes;
    syslog(LOG_WARNING, "Rows wait to be counted until %s can be written", paths::kAccountingDb);
    return false;
}

void Receiver::finish() {
    constexpr int kMostPieces = 64;
    for (int i = 0; i < kMostPieces && takeRows(); ++i) {
    }
    (void)accounting_.RowsUpdate(INT64_MAX);  // cannot fail
    (void)flush();
    ruleWatch_.finish();
}

void Receiver::reloadRules() {
    rules_ = NotificationManager();
    accounting_.RulesReload();
    for (const char* kind : {kSeverity, kKeyword}) {
        alarms_.setInterval(kind, intervalOf(kind));
    }
    ruleWatch_.reload(accounting_);
    channelsTold_ = false;
}

void Receiver::announceHeldBack() {
    constexpr size_t kNamed = 10;
    const auto counts = alarms_.takeHeldBack();
    if (counts.empty()) {
        return;
    }
    std::string devices;
    uint64_t total = 0;
    for (const auto& [device, count] : counts) {
        total += count;
    }
    for (size_t i = 0; i < counts.size() && i < kNamed; ++i) {
        devices += (i == 0 ? "" : ", ") + counts[i].first + " (" + Decimal(counts[i].second) + ")";
    }
    devices += counts.size() > kNamed ? ", ..." : "";
    RecordEvent("[" + Decimal(total) + "] more logs that match a rule were held back: " + devices);
    SendNotice("QUORSYSLOG_HELD_BACK", {{"%COUNT%", Decimal(total)}, {"%DEVICES%", devices}});
}

std::string Receiver::statistics() const {
    const std::pair<const char*, uint64_t> figures[] = {
        {" rows, ", counters_.rows},
        {" devices, ", devices_.count()},
        {" notices, ", alarms_.granted()},
        {" held back, ", alarms_.heldBack()},
        {" flushes failed, ", counters_.failedFlushes},
        {" the last row", follower_.position()},
    };
    std::string text;
    for (const auto& [name, figure] : figures) {
        text += std::to_string(figure) + name;
    }
    return text;
}

}  // namespace quor
