// The rules about devices: that one went silent, sends far too much, or is new.
#ifndef RULES_DEVICEWATCH_H
#define RULES_DEVICEWATCH_H

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "rules/clock.h"
#include "rules/names.h"
#include "rules/pulse.h"
#include "rules/rule.h"

namespace quor::rules {

constexpr size_t kNamedDevices = 10;  // that a report names

// Something to announce. A rule announces all its devices of an interval together, however many they are.
struct Report {
    enum class What { Silent, Back, Loud, New };

    What what;
    std::string rule;
    uint64_t count;       // of devices
    std::string devices;  // the first of them
};

class DeviceWatch {
  public:
    using Time = std::chrono::steady_clock::time_point;

    // Names of more devices than `limit` are not watched.
    explicit DeviceWatch(size_t limit) : limit_(limit) {}

    // Takes the enabled rules of its kinds. Rules that keep their name and kind keep what they have announced.
    void setRules(const std::vector<Rule>& rules);
    bool empty() const { return watched_.empty(); }
    // Whether a rule names the device, not by a pattern.
    bool isNamed(const std::string& device) const { return named_.count(device) != 0; }

    // A device that was counted before, and is not new.
    void know(const std::string& device);
    // A log of a device, received in that Unix second.
    void hear(const std::string& device, int64_t second);
    // A log of a device whose name is not kept apart.
    void hearOther(int64_t second);
    // So many seconds have passed in which no log came.
    void elapse(double seconds) { clock_.elapse(seconds); }
    // Looks who is silent now.
    void judge();
    // What is due by the intervals of the rules, or everything.
    std::vector<Report> takeReports(Time now, bool everything = false);

    // The state as text. A clean one is of this very moment; another one is a little old when it is read.
    std::string save(bool clean) const;
    // False, with nothing changed, for a text that is no state.
    bool load(const std::string& text);

  private:
    struct Note {
        bool told = false;
        bool over = false;  // before it was told
        std::string detail;
    };
    struct Watched {
        Watched(Rule wanted, int64_t now) : rule(std::move(wanted)), hosts(rule.host, rule.notHost), since(now) {}

        Rule rule;
        Choice hosts;
        int64_t since;                       // by the clock
        std::map<std::string, Note> raised;  // devices that are silent, or loud
        std::set<std::string> ended;         // told, and over
        std::string all;                     // what to call them when every device is silent
        bool allTold = false;
        std::string broken;                  // the device that ended the silence of all
        std::vector<std::string> newcomers;  // the first of them
        uint64_t newCount = 0;
        uint64_t newOthers = 0;  // logs of those that are not kept apart
        std::optional<Time> reported;
    };

    Pulse* pulseOf(const std::string& device);
    bool makeRoom();
    void greet(const std::string& device);
    void endSilence(const std::string& device);
    void judgeRate(const std::string& device, const Pulse& pulse);
    void endRate(const std::string& device, const Pulse& pulse);
    void judgeSilence(Watched& watched);
    static int64_t thresholdOf(const Watched& watched, const std::string& device, const Pulse* pulse);
    static bool isNamedBy(const Watched& watched, const std::string& device);
    static void end(Watched& watched, const std::string& device);
    static void reportRaised(Watched& watched, std::vector<Report>& reports);
    static void reportSilence(Watched& watched, std::vector<Report>& reports);
    static void reportNew(Watched& watched, std::vector<Report>& reports);
    void restore(const std::string& device, const Pulse::State& state);
    bool restoreRule(int64_t kind, int64_t since, const std::string& name, const std::string& all);

    size_t limit_;
    Clock clock_;
    std::unordered_map<std::string, Pulse> devices_;
    std::vector<Watched> watched_;
    std::set<std::string> named_;
    int64_t roomMade_ = -1;  // by the clock
};

}  // namespace quor::rules

#endif
