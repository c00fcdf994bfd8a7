// The load beside a writing syslog-ng: searchers, a deleter and a checkpointer, each a process of its own, for a time.
// Usage: soak DATABASE SECONDS [KEEP]    The deleter leaves about KEEP rows. Ends with 1 when any call failed.
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "dbhandler.h"
#include "dbutil.h"

namespace {

using Clock = std::chrono::steady_clock;

constexpr int kSearchers = 8;
constexpr uint32_t kMostSamples = 100000;

struct Figures {
    uint32_t samples;
    uint32_t failures;
    uint64_t largestLog;
    float milliseconds[kMostSamples];
};

struct Load {
    std::string db;
    Clock::time_point end;
    unsigned long long keep;
};

int countRow(_SYSLOG_LOG_DATA_tag& /*record*/, void* rows) {
    ++*static_cast<int*>(rows);
    return 0;
}

// A page of the newest rows; every tenth search is filtered, and not timed.
void search(Load& load, Figures& figures) {
    for (int round = 0; Clock::now() < load.end; ++round) {
        const bool filtered = round % 10 == 9;
        std::list<_SYSLOG_SQL_COND_tag> conditions;
        if (filtered) {
            conditions.push_back({SYSLOG_ATTRI_MSG, 8, "*seq: 00000000" + std::to_string(round % 100) + "*", {}});
        }
        _SYSLOG_SQL_LIMIT_tag limit{50, 0};
        _SYSLOG_SQL_ORDER_tag order{0, SYSLOG_ATTRI_ID};
        int rows = 0;
        const auto begin = Clock::now();
        const int status = SyslogDBSelect(load.db, conditions, &limit, &order, countRow, &rows, false);
        const std::chrono::duration<float, std::milli> taken = Clock::now() - begin;
        figures.failures += status != 0 || (!filtered && rows == 0) ? 1 : 0;
        if (!filtered && figures.samples < kMostSamples) {
            figures.milliseconds[figures.samples++] = taken.count();
        }
        usleep(50000);
    }
}

void deleteOld(Load& load, Figures& figures) {
    while (Clock::now() < load.end) {
        std::list<_SYSLOG_SQL_COND_tag> none;
        const int newest = SyslogDBSelectCount(load.db, none, nullptr, nullptr);
        const auto oldest = newest - static_cast<long long>(load.keep);
        std::list<_SYSLOG_SQL_COND_tag> old{{SYSLOG_ATTRI_ID, 3, std::to_string(oldest), {}}};
        const auto begin = Clock::now();
        figures.failures += newest < 0 || (oldest > 0 && SyslogDBDelete(load.db, old) != 0) ? 1 : 0;
        const std::chrono::duration<float, std::milli> taken = Clock::now() - begin;
        figures.milliseconds[0] = std::max(figures.milliseconds[0], taken.count());
        sleep(2);
    }
}

void checkpoint(Load& load, Figures& figures) {
    while (Clock::now() < load.end) {
        DBHandler handle(load.db, "");
        figures.failures += handle.DBCon() != 0 || handle.DBWalCheckpoint(false) != 0 ? 1 : 0;
        handle.DBDiscon();
        struct stat status = {};
        if (stat((load.db + "-wal").c_str(), &status) == 0) {
            figures.largestLog = std::max(figures.largestLog, static_cast<uint64_t>(status.st_size));
        }
        sleep(1);
    }
}

void start(Load& load, Figures& figures, void (*work)(Load&, Figures&)) {
    if (fork() == 0) {
        work(load, figures);
        _exit(0);
    }
}

}  // namespace

int main(int count, char** arguments) {
    if (count < 3) {
        (void)fputs("usage: soak DATABASE SECONDS [KEEP]\n", stderr);
        return 2;
    }
    Load load{arguments[1], Clock::now() + std::chrono::seconds(strtol(arguments[2], nullptr, 10)),
              count > 3 ? strtoull(arguments[3], nullptr, 10) : 100000};
    constexpr size_t kWorkers = kSearchers + 2;
    void* shared = mmap(nullptr, kWorkers * sizeof(Figures), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0);
    if (shared == MAP_FAILED) {
        return 2;
    }
    auto* figures = static_cast<Figures*>(shared);
    for (int i = 0; i < kSearchers; ++i) {
        start(load, figures[i], search);
    }
    start(load, figures[kSearchers], deleteOld);
    start(load, figures[kSearchers + 1], checkpoint);
    int crashed = 0;
    int status = 0;
    while (wait(&status) > 0) {
        crashed += status != 0 ? 1 : 0;
    }
    std::vector<float> samples;
    for (int i = 0; i < kSearchers; ++i) {
        samples.insert(samples.end(), figures[i].milliseconds, figures[i].milliseconds + figures[i].samples);
    }
    std::sort(samples.begin(), samples.end());
    uint32_t failures = 0;
    for (size_t i = 0; i < kWorkers; ++i) {
        failures += figures[i].failures;
    }
    if (samples.empty()) {
        return 2;
    }
    printf("pages read: %zu, median %.2f ms, p99 %.2f ms, slowest %.2f ms\n", samples.size(),
           static_cast<double>(samples[samples.size() / 2]), static_cast<double>(samples[samples.size() * 99 / 100]),
           static_cast<double>(samples.back()));
    printf("failed calls: %u, crashed processes: %d, largest write-ahead log seen: %llu bytes\n", failures, crashed,
           static_cast<unsigned long long>(figures[kWorkers - 1].largestLog));
    printf("slowest deletion: %.0f ms\n", static_cast<double>(figures[kSearchers].milliseconds[0]));
    return failures == 0 && crashed == 0 ? 0 : 1;
}
