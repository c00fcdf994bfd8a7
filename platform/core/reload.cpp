#include <sys/types.h>

#include <charconv>
#include <csignal>
#include <string>
#include <string_view>

#include "base/guarded.h"
#include "base/paths.h"
#include "base/textfile.h"
#include "quor/quorcore.h"
#include "quor/quorservice.h"

namespace {

constexpr bool kReleasePaths = sizeof(QUOR_ROOT) == 1;
constexpr char kServiceManager[] = "/run/systemd/system";  // there when it runs the system
constexpr char kServiceCommand[] = "/usr/bin/systemctl";

// A name becomes part of a path and an argument of a program that takes patterns.
bool isServiceName(std::string_view name) {
    constexpr std::string_view kAllowed = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789@._:-";
    return !name.empty() && name.front() != '-' && name.front() != '.' &&
           name.find_first_not_of(kAllowed) == std::string_view::npos;
}

// The number alone in the file; 0 for anything else.
pid_t readPid(const std::string& path) {
    constexpr size_t kLimit = 32;
    std::string text;
    if (quor::ReadTextFile(path, kLimit, text) != quor::ReadOutcome::Done) {
        return 0;
    }
    const char* const end = text.data() + text.size();
    pid_t pid = 0;
    const auto number = std::from_chars(text.data(), end, pid);
    const bool alone = number.ec == std::errc{} && (number.ptr == end || *number.ptr == '\n');
    return alone ? pid : 0;
}

bool signalReload(const std::string& pidFile) {
    const pid_t pid = readPid(pidFile);
    return pid > 1 && kill(pid, SIGHUP) == 0;
}

int reload(const std::string& name) {
    const std::string run = std::string(quor::paths::kRunFolder) + "/";
    if (signalReload(run + name + ".pid") || signalReload(run + name + "/" + name + ".pid")) {
        return 0;
    }
    const bool managed = kReleasePaths && QLIBCFileExist(kServiceManager) == 1;
    return managed && QLIBCExec(kServiceCommand, "--quiet", "reload", "--", name.c_str(), nullptr) == 0 ? 0 : -1;
}

}  // namespace

int QLIBServiceReload(const char* service) {
    if (service == nullptr || !isServiceName(service)) {
        return -1;
    }
    return quor::Guarded([service] { return reload(service); });
}

int QLIBServicectlJobReload(const char* job) {
    return QLIBServiceReload(job);
}
