// The databases that the operations run on, made once below the build folder.
#ifndef BENCH_SEARCH_TABLES_H
#define BENCH_SEARCH_TABLES_H

#include <cstdint>
#include <string>

namespace quor::bench {

constexpr int64_t kSmall = 200'000;
constexpr int64_t kLarge = 2'000'000;
constexpr int64_t kHuge = 10'000'000;

enum class Layout {
    kShipped,  // schema/syslog.sql
    kPlain,    // the columns as they come, no index, SQLite's own page size
};

// Path of the database with so many rows in table logs.
std::string TablePath(int64_t rows, Layout layout = Layout::kShipped);

}  // namespace quor::bench

#endif
