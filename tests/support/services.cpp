#include "support/services.h"

#include "quor/quorservice.h"

namespace quor::test {

Services& FakeServices() {
    static Services services;
    return services;
}

}  // namespace quor::test

namespace {

int record(const char* kind, const char* name) {
    quor::test::FakeServices().reloaded.push_back(std::string(kind) + name);
    return quor::test::FakeServices().fail ? -1 : 0;
}

}  // namespace

int QLIBServiceReload(const char* service) {
    return record("service ", service);
}

int QLIBServicectlJobReload(const char* job) {
    return record("job ", job);
}
