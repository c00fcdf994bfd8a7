#include "tests/support/services.h"

#include "quor/quorservice.h"

namespace quor::test {

Services& FakeServices() {
    static Services services;
    return services;
}

}  // namespace quor::test

int QLIBServiceReload(const char* service) {
    quor::test::FakeServices().reloaded.push_back(std::string("service ") + service);
    return quor::test::FakeServices().fail ? -1 : 0;
}

int QLIBServicectlJobReload(const char* job) {
    quor::test::FakeServices().reloaded.push_back(std::string("job ") + job);
    return quor::test::FakeServices().fail ? -1 : 0;
}
