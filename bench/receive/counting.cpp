#include <ctime>
#include <filesystem>
#include <string>
#include <vector>

#include "accounting.h"
#include "base/paths.h"
#include "bench/receive/measure.h"

namespace {

time_t clockAhead = 0;  // seconds

}  // namespace

// The clock of this program, which can be put forward to close a sample without waiting.
extern "C" [[gnu::visibility("default")]] time_t time(time_t* timer) noexcept {
    timespec now{};
    (void)clock_gettime(CLOCK_REALTIME_COARSE, &now);
    now.tv_sec += clockAhead;
    if (timer != nullptr) {
        *timer = now.tv_sec;
    }
    return now.tv_sec;
}

namespace quor::bench {
namespace {

std::vector<std::string> deviceNames(size_t count) {
    std::vector<std::string> names(count);
    for (size_t i = 0; i < count; ++i) {
        names[i] = "router" + std::to_string(i * 7919 % count) + ".example.net";
    }
    return names;
}

// Walks the whole list for every log.
struct BareList {
    std::list<QUORLOG_LOG_DEVICE_STATISTIC> rows;

    void count(const std::string& device) {
        bool known = false;
        for (QUORLOG_LOG_DEVICE_STATISTIC& row : rows) {
            const bool same = row.device == device;
            row.count += same ? 1 : 0;
            known = known || same;
        }
        if (!known) {
            rows.push_back({device, 1});
        }
    }
};

void removeDatabase() {
    for (const char* suffix : {"", "-wal", "-shm"}) {
        std::filesystem::remove(paths::kAccountingDb + std::string(suffix));
    }
}

void measureCounts(size_t devices) {
    const std::vector<std::string> names = deviceNames(devices);
    AccountingManager accounting;
    BareList list;
    for (const std::string& device : names) {
        list.rows.push_back({device, 0});
    }
    size_t next = 0;
    const auto name = [&]() -> const std::string& { return names[next++ % names.size()]; };
    const int listCalls = static_cast<int>(std::max<size_t>(2000000 / devices, 1000));
    const double ours = BestSeconds(5, 500000, [&] { (void)accounting.LogInc(name()); });
    const double rival = BestSeconds(3, listCalls, [&] { list.count(name()); });
    Report(("LogInc, " + std::to_string(devices) + " devices, beside a bare list").c_str(), ours, rival, "logs/s", 1);
    (void)accounting.EpsListTrim(0);
}

// An hour of samples of 20 devices, in one transaction; the rival is the target.
void measureFlush() {
    constexpr int kSamples = 3600;
    constexpr double kTargetRows = 150000;
    const std::vector<std::string> names = deviceNames(20);
    double best = 1e9;
    for (int round = 0; round < 3; ++round) {
        removeDatabase();
        AccountingManager accounting;
        for (int sample = 0; sample < kSamples; ++sample) {
            for (const std::string& name : names) {
                (void)accounting.LogInc(name);
            }
            ++clockAhead;
            (void)accounting.CurEpsUpdate();
        }
        best = std::min(best, BestSeconds(1, 1, [&] { (void)accounting.AccoutingFlush2DB(); }));
    }
    const double rows = kSamples * 20.0;
    Report("AccoutingFlush2DB of 3,600 samples (target)", best, rows / kTargetRows, "rows/s", rows);
}

}  // namespace

void MeasureCounting() {
    std::filesystem::create_directories(std::filesystem::path(paths::kAccountingDb).parent_path());
    removeDatabase();
    for (const size_t devices : {10U, 100U, 1000U, 10000U}) {
        measureCounts(devices);
    }
    measureFlush();
    removeDatabase();
}

}  // namespace quor::bench
