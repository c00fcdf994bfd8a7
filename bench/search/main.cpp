// Options are Google Benchmark's. QUOR_BENCH_ROWS=10000000 adds the largest table.
#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <exception>

#include "bench/search/operations.h"
#include "bench/search/tables.h"

int main(int argc, char** argv) try {
    const char* rows = getenv("QUOR_BENCH_ROWS");
    quor::bench::PrintMemory();
    (void)fflush(stdout);
    quor::bench::AddSearches(rows != nullptr && strtoll(rows, nullptr, 10) >= quor::bench::kHuge);
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    return 0;
} catch (const std::exception& problem) {
    (void)fprintf(stderr, "quor_bench: %s\n", problem.what());
    return 1;
}
