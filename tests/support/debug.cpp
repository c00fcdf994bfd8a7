#include <syslog.h>

#include <utility>

#include "common.h"
#include "tests/support/system_log.h"

namespace {

std::vector<std::string> dropped;

}  // namespace

std::vector<std::string> quor::test::TakeDropped() {
    return std::exchange(dropped, {});
}

void Debuger::MSG(int level, std::string message) {
    if (level < 1) {
        syslog(LOG_ERR, "%s", message.c_str());
    } else {
        dropped.push_back(std::to_string(level) + " " + message);
    }
}
