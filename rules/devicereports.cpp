// What the rules about devices announce.
#include <algorithm>
#include <utility>

#include "base/numbers.h"
#include "rules/devicewatch.h"

namespace quor::rules {
namespace {

// Devices, the first of them by name.
class List {
  public:
    void add(const std::string& device, const std::string& detail = "") {
        if (count_++ < kNamedDevices) {
            text_.append(text_.empty() ? "" : ", ").append(device);
            text_.append(detail.empty() ? "" : " (" + detail + ")");
        }
    }
    void addTo(std::vector<Report>& reports, Report::What what, const std::string& rule) const {
        if (count_ != 0) {
            const std::string more = count_ > kNamedDevices ? " and " + Decimal(count_ - kNamedDevices) + " more" : "";
            reports.push_back({what, rule, count_, text_ + more});
        }
    }

  private:
    std::string text_;
    uint64_t count_ = 0;
};

}  // namespace

void DeviceWatch::reportRaised(Watched& watched, std::vector<Report>& reports) {
    List list;
    for (auto entry = watched.raised.begin(); entry != watched.raised.end();) {
        Note& note = entry->second;
        if (!std::exchange(note.told, true)) {
            list.add(entry->first, note.detail);
        }
        if (note.over && watched.rule.kind == Kind::Silent) {
            watched.ended.insert(entry->first);
        }
        entry = note.over ? watched.raised.erase(entry) : std::next(entry);
    }
    list.addTo(reports, watched.rule.kind == Kind::Silent ? Report::What::Silent : Report::What::Loud,
               watched.rule.name);
}

void DeviceWatch::reportSilence(Watched& watched, std::vector<Report>& reports) {
    if (!watched.all.empty() && !std::exchange(watched.allTold, true)) {
        reports.push_back({Report::What::Silent, watched.rule.name, 1, watched.all});
    }
    List ended;
    const std::string broken = std::exchange(watched.broken, "");
    if (!broken.empty()) {
        ended.add(broken, "the first of all devices");
    }
    for (const std::string& device : std::exchange(watched.ended, {})) {
        ended.add(device);
    }
    ended.addTo(reports, Report::What::Back, watched.rule.name);
}

void DeviceWatch::reportNew(Watched& watched, std::vector<Report>& reports) {
    const uint64_t count = std::exchange(watched.newCount, 0);
    const uint64_t others = std::exchange(watched.newOthers, 0);
    std::string text;
    for (const std::string& device : std::exchange(watched.newcomers, {})) {
        text.append(text.empty() ? "" : ", ").append(device);
    }
    text += count > kNamedDevices ? " and " + Decimal(count - kNamedDevices) + " more" : "";
    if (others != 0) {
        text += (text.empty() ? "" : "; ") + Decimal(others) + " logs came from names beyond those that are kept apart";
    }
    if (!text.empty()) {
        reports.push_back({Report::What::New, watched.rule.name, count, text});
    }
}

// The first one is told at once, those that follow together.
std::vector<Report> DeviceWatch::takeReports(Time now, bool everything) {
    std::vector<Report> reports;
    for (Watched& watched : watched_) {
        if (watched.reported && !everything &&
            now - *watched.reported < std::chrono::seconds(IntervalOf(watched.rule))) {
            continue;
        }
        const size_t before = reports.size();
        if (watched.rule.kind == Kind::NewDevice) {
            reportNew(watched, reports);
        } else {
            reportRaised(watched, reports);
            reportSilence(watched, reports);
        }
        if (reports.size() != before) {
            watched.reported = now;
        }
    }
    return reports;
}

}  // namespace quor::rules
