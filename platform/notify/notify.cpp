// The notification service as its callers see it.
#include <ctime>
#include <optional>

#include "base/guarded.h"
#include "platform/notify/channels.h"
#include "platform/notify/filter.h"
#include "platform/notify/interval.h"
#include "platform/notify/render.h"
#include "platform/notify/spool.h"
#include "platform/notify/worker.h"

namespace quor::notify {
namespace {

constexpr int kCallerWaitsMs = 500;  // others hold the spool for far less than one, unless the system stops them

enum class Outcome { Failed, NothingToDo, Deliver };

Outcome queue(const Spool& spool, Notice& notice, int32_t seconds) {
    Interval interval(spool.ledger(), notice);
    if (!interval.due(seconds, notice.time)) {
        return interval.countHeldBack() ? Outcome::NothingToDo : Outcome::Failed;
    }
    if (spool.full()) {
        return interval.countHeldBack() ? Outcome::Deliver : Outcome::Failed;
    }
    notice.heldBack = interval.heldBack();
    return spool.put(notice) && interval.countSent(seconds, notice.time) ? Outcome::Deliver : Outcome::Failed;
}

int send(const std::string& tag, const char* textsDir, const char* filterFile, QLIBSZHASH* values) {
    std::optional<Notice> notice = Render(tag, textsDir, values);
    if (!notice) {
        return -1;
    }
    const std::optional<Settings> settings = LoadSettings();
    const FilterRule rule = LoadFilterRule(filterFile, tag);
    notice->channels = settings ? ConfiguredChannels(*settings) & rule.channels : 0;
    if (notice->channels == 0 || ReportsOwnFailure(QLIBCSzHashGetValue(values, "%SYSLOG_CONTENT%"))) {
        return 0;
    }
    notice->time = time(nullptr);
    Descriptor slot;
    {
        const Spool spool(kCallerWaitsMs);
        const Outcome outcome = spool ? queue(spool, *notice, rule.interval) : Outcome::Failed;
        if (outcome != Outcome::Deliver) {
            return outcome == Outcome::Failed ? -1 : 0;
        }
        slot = spool.freeSlot();
    }
    return slot ? StartWorker(slot) : 0;  // no slot: the workers that hold them find the notice
}

int test(void (*report)(const char*, int, const char*, void*), void* context) {
    const std::optional<Settings> settings = LoadSettings();
    if (!settings) {
        return -1;
    }
    Notice notice;
    notice.tag = "QUORSYSLOG_TEST";
    notice.subject = "Test notice of the log server";
    notice.body = "This is a test notice of the log server. Nothing needs to be done.\n";
    notice.time = time(nullptr);
    int tried = 0;
    for (const Channel& channel : Channels()) {
        if (channel.configured(*settings)) {
            const std::string cause = channel.deliver(*settings, notice);
            report(channel.name, cause.empty() ? 1 : 0, cause.c_str(), context);
            ++tried;
        }
    }
    return tried;
}

}  // namespace
}  // namespace quor::notify

int QUORSysNotifySendNotificationCustomized(const char* tag, const char* textsDir, const char* filterFile,
                                            QLIBSZHASH* values, int /*flags*/) {
    if (quor::AnyNull(tag, textsDir, values)) {
        return -1;
    }
    return quor::Guarded([&] { return quor::notify::send(tag, textsDir, filterFile, values); });
}

int QUORNotifyTest(void (*report)(const char* channel, int ok, const char* detail, void* context), void* context) {
    if (report == nullptr) {
        return -1;
    }
    return quor::Guarded([&] { return quor::notify::test(report, context); });
}
