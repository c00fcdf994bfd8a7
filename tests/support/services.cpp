#include "tests/support/services.h"

#include <cstdarg>

#include "quor/quorcore.h"
#include "quor/quorservice.h"
#include "tests/support/real.h"

int QLIBServiceReload(const char* service) {
    quor::test::FakeServices().reloaded.push_back(std::string("service ") + service);
    return quor::test::FakeServices().fail ? -1 : 0;
}

int QLIBServicectlJobReload(const char* job) {
    quor::test::FakeServices().reloaded.push_back(std::string("job ") + job);
    return quor::test::FakeServices().fail ? -1 : 0;
}

// As the library calls it: with two arguments.
int QLIBCExec(const char* program, ...) {
    va_list arguments;
    va_start(arguments, program);
    const char* const option = va_arg(arguments, const char*);
    const char* const command = va_arg(arguments, const char*);
    va_end(arguments);
    quor::test::Services& services = quor::test::FakeServices();
    services.commands.push_back(std::string(program) + " " + option + " " + command);
    const bool fails = !services.failing.empty() && std::string(command).find(services.failing) != std::string::npos;
    const char* const end = nullptr;
    return fails ? -1 : quor::test::Real(QLIBCExec, __func__)(program, option, command, end);
}
