// Finds the counters of a device without walking the histogram and, within a sample, without searching its map.
#ifndef ACCOUNTING_DEVICEINDEX_H
#define ACCOUNTING_DEVICEINDEX_H

#include <string_view>
#include <unordered_map>

#include "accounting.h"

// Points into the histogram and into the map of the open sample, whose nodes never move.
struct AccountingManager::DeviceIndex {
    struct Entry {
        QUORLOG_LOG_DEVICE_STATISTIC* row = nullptr;
        int32_t* sampleCount = nullptr;  // the device's count in the sample numbered `sample`
        uint64_t sample = 0;
    };

    std::unordered_map<std::string_view, Entry> entries;  // named by the texts of the rows
    uint64_t openSample = 1;                              // counts of earlier samples are closed

    // The entry of `device`; a new device gets a row at the end of the histogram.
    Entry& at(const std::string& device, std::list<QUORLOG_LOG_DEVICE_STATISTIC>& histogram);
};

#endif
