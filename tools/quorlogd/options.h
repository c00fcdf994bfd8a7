// What the command line sets.
#ifndef QUORLOGD_OPTIONS_H
#define QUORLOGD_OPTIONS_H

#include <cstdint>
#include <string>

#include "base/paths.h"

namespace quor {

struct Options {
    std::string db = paths::kWorkingDb;
    unsigned flushSeconds = 10;
    unsigned checkSeconds = 60;
    std::string control = paths::kReceiverControl;  // of syslog-ng; empty: not asked
    unsigned udpPort = 0;                           // 0: that of syslog-ng's configuration
    unsigned noticesPerMinute = 60;
    size_t maxDevices = 20000;
    unsigned long long maxWaiting = 200000;  // counts of devices in samples that could not be written
    std::string volume;                      // any folder on the volume of the logs
    double volumeFullPercent = 95;           // 0: not checked
    int workingDbMaxKb = 0;                  // 0: not checked
    bool toStandardError = false;
};

}  // namespace quor

#endif
