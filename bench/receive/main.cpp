// What receiving costs: parsing, counting, writing and reading statistics, each beside the plain way of doing it.
#include "bench/receive/measure.h"

int main() {
    printf("%-44s %12s %-8s %12s %8s\n", "operation", "ours", "", "rival", "faster");
    quor::bench::MeasureParsing();
    quor::bench::MeasureCounting();
    quor::bench::MeasureStatistics();
    return 0;
}
