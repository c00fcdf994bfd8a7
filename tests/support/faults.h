// A disk or a memory that fails on demand, for this program and the libraries that it uses.
#ifndef TESTS_SUPPORT_FAULTS_H
#define TESTS_SUPPORT_FAULTS_H

#include <cstdint>

namespace quor::test {

enum class Resource {
    Disk,    // calls that open, change, rename or remove a file; written files are never forced to the disk
    Memory,  // allocations; those by C++ alone under AddressSanitizer, which keeps malloc to itself
};

// From here to its destruction the n-th use (from 1) fails, and with `onwards` every later one, but for those that give
// space back.
class Fault {
  public:
    Fault(Resource resource, int nth, bool onwards);
    Fault(const Fault&) = delete;
    Fault& operator=(const Fault&) = delete;
    ~Fault();
    static bool struck();
};

// Blocks allocated and not freed; always 0 under AddressSanitizer, which finds leaks itself.
int64_t LiveBlocks();

}  // namespace quor::test

#endif
