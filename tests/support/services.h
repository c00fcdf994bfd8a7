// Service reloads and shell commands of the test program: recorded, and failing on demand.
#ifndef TESTS_SUPPORT_SERVICES_H
#define TESTS_SUPPORT_SERVICES_H

#include <string>
#include <vector>

namespace quor::test {

struct Services {
    std::vector<std::string> reloaded;  // "service NAME" or "job NAME", in order
    bool fail = false;
    std::vector<std::string> commands;  // "PROGRAM OPTION COMMAND", run for real
    std::string failing;                // a command that contains this is not run, when not empty
};

inline Services& FakeServices() {
    static Services services;
    return services;
}

}  // namespace quor::test

#endif
