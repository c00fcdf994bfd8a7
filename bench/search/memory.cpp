// Memory of results, measured from outside: the peak of a process that reads one.
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <functional>

#include "bench/search/operations.h"
#include "bench/search/tables.h"
#include "common/handles.h"

namespace quor::bench {
namespace {

// In KiB.
long peakOf(const std::function<void()>& work) {
    const pid_t child = fork();
    if (child == 0) {
        work();
        _exit(0);
    }
    rusage usage{};
    wait4(child, nullptr, 0, &usage);
    return usage.ru_maxrss;
}

void readEveryRow(const std::string& path) {
    const Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str()));
    Result result;
    QUORDBExecute(connection.get(), "SELECT * FROM logs", Adopt(result));
    unsigned int row = 0;
    while (QUORDBFetchRow(result.get(), &row) >= 0) {
        (void)QUORDBFetchField(result.get(), row, "msg");
    }
}

}  // namespace

void PrintMemory() {
    const long idle = peakOf([] {});
    for (const int64_t rows : {kSmall, kLarge}) {
        const std::string path = TablePath(rows);
        const long peak = peakOf([&] { readEveryRow(path); });
        printf("memory/%lld: peak of the process %ld MiB, %.0f bytes a row\n", static_cast<long long>(rows),
               peak / 1024, static_cast<double>(peak - idle) * 1024 / static_cast<double>(rows));
    }
}

}  // namespace quor::bench
