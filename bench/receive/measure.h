// Times operations and prints each beside its rival.
#ifndef BENCH_RECEIVE_MEASURE_H
#define BENCH_RECEIVE_MEASURE_H

#include <algorithm>
#include <cstdio>
#include <ctime>

namespace quor::bench {

inline double ProcessorSeconds() {
    timespec used{};
    (void)clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &used);
    return static_cast<double>(used.tv_sec) + static_cast<double>(used.tv_nsec) * 1e-9;
}

// Processor time of one call: the best of several rounds, which others on the machine disturb least.
template <typename Operation>
double BestSeconds(int rounds, int calls, Operation operation) {
    double best = 1e9;
    for (int round = 0; round < rounds; ++round) {
        const double start = ProcessorSeconds();
        for (int call = 0; call < calls; ++call) {
            operation();
        }
        best = std::min(best, (ProcessorSeconds() - start) / calls);
    }
    return best;
}

inline void Report(const char* name, double ours, double rival, const char* unit, double perSecond) {
    printf("%-44s %12.0f %-8s %12.0f %6.2f x\n", name, perSecond / ours, unit, perSecond / rival, rival / ours);
}

// The operations, by file.
void MeasureParsing();
void MeasureCounting();
void MeasureStatistics();

}  // namespace quor::bench

#endif
