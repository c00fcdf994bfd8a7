#include "rules/devicewatch.h"

#include <algorithm>
#include <cmath>
#include <utility>

#include "base/numbers.h"
#include "store/dates.h"

namespace quor::rules {
namespace {

std::string decimalOf(double value) {
    return Decimal(static_cast<uint64_t>(std::llround(std::max(value, 0.0))));
}

}  // namespace

void DeviceWatch::setRules(const std::vector<Rule>& rules) {
    std::vector<Watched> former = std::exchange(watched_, {});
    named_.clear();
    for (const Rule& rule : rules) {
        if (rule.kind == Kind::Match || !rule.enabled) {
            continue;
        }
        const auto same = std::find_if(former.begin(), former.end(), [&rule](const Watched& one) {
            return one.rule.name == rule.name && one.rule.kind == rule.kind;
        });
        Watched watched = same != former.end() ? std::move(*same) : Watched(rule, clock_.ofLogs());
        watched.rule = rule;
        watched.hosts = Choice(rule.host, rule.notHost);
        for (auto entry = watched.raised.begin(); entry != watched.raised.end();) {
            entry = watched.hosts.takes(entry->first) ? std::next(entry) : watched.raised.erase(entry);
        }
        named_.insert(watched.hosts.named().begin(), watched.hosts.named().end());
        watched_.push_back(std::move(watched));
    }
}

// Those that were not heard for two days make room, looked for once an hour.
bool DeviceWatch::makeRoom() {
    if (devices_.size() < limit_) {
        return true;
    }
    const int64_t now = clock_.ofLogs();
    if (roomMade_ < 0 || now - roomMade_ >= 60 * kMinute) {
        roomMade_ = now;
        for (auto entry = devices_.begin(); entry != devices_.end();) {
            const bool old = entry->second.state().last < now - 2 * kDay && !isNamed(entry->first);
            entry = old ? devices_.erase(entry) : std::next(entry);
        }
    }
    return devices_.size() < limit_;
}

void DeviceWatch::know(const std::string& device) {
    if (devices_.size() < limit_) {
        (void)devices_.try_emplace(device);
    }
}

// Null when there is no room for it.
Pulse* DeviceWatch::pulseOf(const std::string& device) {
    const auto known = devices_.find(device);
    if (known != devices_.end()) {
        return &known->second;
    }
    if (!makeRoom() && !isNamed(device)) {
        return nullptr;
    }
    greet(device);
    return &devices_[device];
}

void DeviceWatch::greet(const std::string& device) {
    for (Watched& watched : watched_) {
        if (watched.rule.kind == Kind::NewDevice && watched.hosts.takes(device)) {
            ++watched.newCount;
            if (watched.newcomers.size() < kNamedDevices) {
                watched.newcomers.push_back(device);
            }
        }
    }
}

void DeviceWatch::end(Watched& watched, const std::string& device) {
    const auto raised = watched.raised.find(device);
    if (raised == watched.raised.end()) {
        return;
    }
    if (!raised->second.told) {
        raised->second.over = true;
        return;
    }
    if (watched.rule.kind == Kind::Silent) {
        watched.ended.insert(device);
    }
    watched.raised.erase(raised);
}

void DeviceWatch::endSilence(const std::string& device) {
    for (Watched& watched : watched_) {
        if (watched.rule.kind != Kind::Silent) {
            continue;
        }
        if (!watched.all.empty()) {
            watched.broken = watched.allTold ? device : "";
            watched.all.clear();
            watched.allTold = false;
        }
        end(watched, device);
    }
}

void DeviceWatch::judgeRate(const std::string& device, const Pulse& pulse) {
    const auto logs = static_cast<double>(pulse.state().logs);
    for (Watched& watched : watched_) {
        if (watched.rule.kind == Kind::Rate && logs > pulse.limit(watched.rule.factor) && pulse.hasRate() &&
            !clock_.resumes() && watched.hosts.takes(device)) {
            Note& note = watched.raised[device];
            note.over = false;
            note.detail = note.told ? note.detail
                                    : decimalOf(logs) + " logs in a minute, usually " + decimalOf(pulse.state().mean);
        }
    }
}

// A minute of it is over: it is loud no more when it had half of what is too much.
void DeviceWatch::endRate(const std::string& device, const Pulse& pulse) {
    const bool next = clock_.ofLogs() / kMinute == pulse.state().last / kMinute + 1;
    for (Watched& watched : watched_) {
        if (watched.rule.kind == Kind::Rate &&
            (!next || static_cast<double>(pulse.state().logs) <= pulse.limit(watched.rule.factor) / 2)) {
            end(watched, device);
        }
    }
}

void DeviceWatch::hear(const std::string& device, int64_t second) {
    clock_.hear(second);
    endSilence(device);
    Pulse* const pulse = pulseOf(device);
    if (pulse == nullptr) {
        return;
    }
    if (pulse->beginsMinute(clock_.ofLogs())) {
        endRate(device, *pulse);
    }
    pulse->hear(clock_.ofLogs(), second);
    judgeRate(device, *pulse);
}

void DeviceWatch::hearOther(int64_t second) {
    clock_.hear(second);
    endSilence("(other devices)");
    for (Watched& watched : watched_) {
        watched.newOthers += watched.rule.kind == Kind::NewDevice ? 1 : 0;
    }
}

bool DeviceWatch::isNamedBy(const Watched& watched, const std::string& device) {
    const std::vector<std::string>& named = watched.hosts.named();
    return std::find(named.begin(), named.end(), device) != named.end();
}

// -1 when it is not watched yet. One that is named is watched before it was ever heard.
int64_t DeviceWatch::thresholdOf(const Watched& watched, const std::string& device, const Pulse* pulse) {
    const bool heard = pulse != nullptr && pulse->state().last >= watched.since;
    const bool named = isNamedBy(watched, device);
    if ((!heard && !named) || !watched.hosts.takes(device)) {
        return -1;
    }
    if (watched.rule.after != kLearnt) {
        return watched.rule.after;
    }
    const bool rhythm = pulse != nullptr && pulse->hasRhythm();
    return rhythm ? pulse->patience() : named ? kDay : -1;
}

void DeviceWatch::judgeSilence(Watched& watched) {
    const bool reception = clock_.quiet() <= clock_.patience();
    uint64_t all = 0;
    std::string one;
    const auto look = [&](const std::string& device, const Pulse* pulse) {
        const int64_t threshold = thresholdOf(watched, device, pulse);
        if (threshold < 0 || watched.raised.count(device) != 0) {
            return;
        }
        const int64_t last = pulse != nullptr ? std::max(pulse->state().last, watched.since) : watched.since;
        if (!reception && clock_.quiet() >= threshold) {
            ++all;
            one = device;
        } else if (reception && clock_.now() - last >= threshold) {
            const bool heard = pulse != nullptr && pulse->wasHeard();
            watched.raised[device].detail =
                heard ? "last heard " + store::LocalTime(pulse->state().second) : "never heard";
        }
    };
    for (const std::string& device : watched.hosts.named()) {
        if (devices_.count(device) == 0) {
            look(device, nullptr);
        }
    }
    for (const auto& [device, pulse] : devices_) {
        look(device, &pulse);
    }
    if (all != 0 && watched.all.empty()) {
        watched.all = all == 1 ? one : "any of " + Decimal(all) + " devices";
    }
}

void DeviceWatch::judge() {
    for (Watched& watched : watched_) {
        if (watched.rule.kind == Kind::Silent) {
            judgeSilence(watched);
        }
    }
}

}  // namespace quor::rules
