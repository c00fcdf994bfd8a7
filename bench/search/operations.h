#ifndef BENCH_SEARCH_OPERATIONS_H
#define BENCH_SEARCH_OPERATIONS_H

namespace quor::bench {

// Registers every operation, making the tables that they run on. `huge` adds the pages of the largest table.
void AddSearches(bool huge);

// Prints the memory that a result takes.
void PrintMemory();

}  // namespace quor::bench

#endif
