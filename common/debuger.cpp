#include <syslog.h>

#include "common.h"

Debuger::Debuger() = default;

Debuger::~Debuger() = default;

void Debuger::MSG(int level, std::string message) {
    if (level < 1) {
        syslog(LOG_ERR, "%s", message.c_str());
    }
}
