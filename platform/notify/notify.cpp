// The notification service as its callers see it.
#include <algorithm>
#include <ctime>
#include <optional>
#include <utility>
#include <vector>

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

struct Target {
    const Channel* channel;
    std::string name;
};

std::vector<Target> targetsOf(const Settings& settings, uint32_t channels) {
    std::vector<Target> targets;
    for (size_t i = 0; i < kChannelCount; ++i) {
        for (std::string& name : Channels()[i].targets(settings)) {
            if ((channels & 1U << i) != 0) {
                targets.push_back({&Channels()[i], std::move(name)});
            }
        }
    }
    return targets;
}

// Once for each target. A queue that is full, because its server does not answer, costs the other channels nothing.
bool put(const Spool& spool, Notice& notice, const std::vector<Target>& targets) {
    bool done = true;
    for (const auto& [channel, name] : targets) {
        notice.target = name;
        if (spool.full(channel->name)) {
            spool.giveUp(channel->name, notice, "too many notices wait for this channel");
        } else {
            done = spool.put(channel->name, notice) && done;
        }
    }
    return done;
}

bool queue(const Spool& spool, Notice& notice, const std::vector<Target>& targets, int32_t seconds) {
    Interval interval(spool.ledger(), notice);
    const bool full = std::all_of(targets.begin(), targets.end(),
                                  [&](const Target& target) { return spool.full(target.channel->name); });
    if (full || !interval.due(seconds, notice.time)) {
        return interval.countHeldBack();
    }
    notice.heldBack = interval.heldBack();
    return put(spool, notice, targets) && interval.countSent(seconds, notice.time);
}

int send(const std::string& tag, const char* textsDir, const char* filterFile, QLIBSZHASH* values) {
    std::optional<Notice> notice = Render(tag, textsDir, values);
    if (!notice) {
        return -1;
    }
    const std::optional<Settings> settings = LoadSettings();
    const FilterRule rule = LoadFilterRule(filterFile, tag);
    const std::vector<Target> targets = settings ? targetsOf(*settings, rule.channels) : std::vector<Target>();
    if (targets.empty() || ReportsOwnFailure(QLIBCSzHashGetValue(values, "%SYSLOG_CONTENT%"))) {
        return 0;
    }
    notice->time = time(nullptr);
    bool queued = false;
    std::vector<Worker> workers;
    {
        const Spool spool(kCallerWaitsMs);
        queued = spool && queue(spool, *notice, targets, rule.interval);
        workers = spool ? WorkersNeeded(spool) : std::move(workers);
    }
    return StartWorkers(workers) == 0 && queued ? 0 : -1;
}

int resume() {
    std::vector<Worker> workers;
    {
        const Spool spool(kCallerWaitsMs);
        if (!spool) {
            return -1;
        }
        workers = WorkersNeeded(spool);
    }
    return StartWorkers(workers);
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
        const std::vector<std::string> targets = channel.targets(*settings);
        for (size_t i = 0; i < targets.size(); ++i, ++tried) {
            const std::string number = targets.size() > 1 ? " " + std::to_string(i + 1) : "";
            notice.target = targets[i];
            const std::string cause = channel.deliver(*settings, notice).cause;
            report((channel.name + number).c_str(), cause.empty() ? 1 : 0, cause.c_str(), context);
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

int QUORNotifyResume() {
    return quor::Guarded([] { return quor::notify::resume(); });
}

int QUORNotifyGivenUp(void (*report)(const char* channel, const char* subject, const char* cause, void* context),
                      void* context) {
    if (report == nullptr) {
        return -1;
    }
    return quor::Guarded([&] {
        return quor::notify::TakeGivenUp(quor::notify::kCallerWaitsMs, [&](auto channel, auto subject, auto cause) {
            report(channel, subject, cause, context);
        });
    });
}
