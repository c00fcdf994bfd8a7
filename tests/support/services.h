// Service reloads of the test program: recorded, and failing on demand.
#ifndef TESTS_SUPPORT_SERVICES_H
#define TESTS_SUPPORT_SERVICES_H

#include <string>
#include <vector>

namespace quor::test {

struct Services {
    std::vector<std::string> reloaded;  // "service NAME" or "job NAME", in order
    bool fail = false;
};

Services& FakeServices();

}  // namespace quor::test

#endif
