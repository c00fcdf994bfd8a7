// Log rows as a small network sends them, the same in every run.
#ifndef BENCH_SEARCH_ROWS_H
#define BENCH_SEARCH_ROWS_H

#include <cstdint>
#include <random>
#include <string>

namespace quor::bench {

constexpr const char* kCommonHost = "core-switch";
constexpr const char* kRareHost = "lobby-printer";  // some twenty rows in a million
constexpr const char* kRareProgram = "mcelog";      // likewise
constexpr const char* kAbsentName = "no-such-name";
constexpr int64_t kFirstSecond = 1'700'006'400;  // midnight, UTC
constexpr int64_t kDays = 60;                    // that any table spans

struct Row {
    std::string host, ip, fac, prio, tag, tzoffset, ldate, ltime, prog, msg;
    int64_t utcsec = 0;
};

class RowSource {
  public:
    explicit RowSource(int64_t total) : total_(total) {}
    const Row& next();

  private:
    size_t pick(size_t count) { return random_() % count; }
    size_t pickSkewed(size_t count);
    void setHost();
    void setProgram();
    void setTime();
    std::string placeholder(char kind);
    std::string message(const char* pattern);

    std::mt19937 random_{42};
    int64_t total_;
    int64_t made_ = 0;
    Row row_;
};

}  // namespace quor::bench

#endif
