// The same work written by hand against SQLite.
#ifndef BENCH_SEARCH_RIVALS_H
#define BENCH_SEARCH_RIVALS_H

#include <cstdint>
#include <string>

#include "dbutil.h"

namespace quor::bench {

// Adds up what a callback sees, so that nothing is optimised away.
int AddUp(_SYSLOG_LOG_DATA_tag& record, void* sum);

// Opens, runs the statement reading every field as text, closes. Gives the number of rows.
int64_t RunByHand(const std::string& path, const std::string& sql);

// Every row into a record: the fastest loop there is, the usual one, and the one call that SQLite has for it.
uint64_t FastestLoop(const std::string& path);
uint64_t UsualLoop(const std::string& path);
uint64_t WholeTable(const std::string& path);

}  // namespace quor::bench

#endif
