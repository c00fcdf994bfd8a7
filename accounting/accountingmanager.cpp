#include <ctime>
#include <limits>
#include <new>

#include "accounting/deviceindex.h"
#include "base/paths.h"
#include "common.h"
#include "logger.h"

AccountingManager::DeviceIndex::Entry&
AccountingManager::DeviceIndex::at(const std::string& device, std::list<QUORLOG_LOG_DEVICE_STATISTIC>& histogram) {
    const auto known = entries.find(device);
    if (known != entries.end()) {
        return known->second;
    }
    std::list<QUORLOG_LOG_DEVICE_STATISTIC> fresh{{device, 0}};
    Entry& entry = entries[fresh.front().device];
    entry.row = &fresh.front();
    histogram.splice(histogram.end(), fresh);  // once nothing can fail any more
    return entry;
}

AccountingManager::AccountingManager() : index_(std::make_unique<DeviceIndex>()) {
    (void)ConfigLoad();  // cannot fail
    for (const auto& [device, count] : SyslogDBHistGet(dbPath_, 0)) {
        index_->at(device, histogram_).row->count = count;
    }
}

AccountingManager::~AccountingManager() {
    if (followsRows_) {
        return;  // what was not written is counted again from the rows
    }
    try {
        (void)AccoutingFlush2DB();  // reports its own failure
    } catch (const std::bad_alloc&) {
        return;  // there was no memory left to report that it failed
    }
}

int AccountingManager::ConfigLoad() {
    dbPath_ = quor::paths::kAccountingDb;
    return 0;
}

void AccountingManager::RulesReload() {
    notifier_ = NotificationManager();
}

void AccountingManager::Count(const std::string& device) {
    DeviceIndex::Entry& entry = index_->at(device, histogram_);
    if (entry.sample != index_->openSample) {
        entry.sampleCount = &epsDeviceCount_[device];
        entry.sample = index_->openSample;
    }
    if (*entry.sampleCount < std::numeric_limits<int32_t>::max()) {
        ++*entry.sampleCount;
    }
    ++curEps_;
    ++entry.row->count;
}

int AccountingManager::LogInc(std::string device) {
    ++totalCount_;
    (void)CurEpsUpdate();  // cannot fail
    Count(device);
    return 0;
}

int AccountingManager::CurEpsUpdate() {
    const auto now = static_cast<long long>(time(nullptr));
    if (now != epsStamp_ && curEps_ != 0) {
        CloseSample(now);
    }
    return 0;
}

void AccountingManager::CloseSample(long long stamp) {
    epsStamp_ = stamp;
    epsList_.push_back({stamp, curEps_, {}});
    epsList_.back().devices.swap(epsDeviceCount_);
    ++index_->openSample;
    if (notifier_.CheckEps(curEps_)) {
        const bool sent = notifier_.NotificationSendEps(curEps_) >= 0;
        Debuger::MSG(sent ? 2 : 0, sent ? "Send EPS notification" : "Fail to send syslog notification");
        (void)Logger().LogAddNotifyEps(curEps_);  // reports its own failure
    }
    curEps_ = 0;
}

unsigned long long AccountingManager::TotalCountGet() {
    return totalCount_;
}

unsigned long long AccountingManager::CurrentEpsGet() {
    return curEps_;
}

bool AccountingManager::isNeed2Flush() {
    const auto now = static_cast<uint32_t>(time(nullptr));
    const auto elapsed = static_cast<int32_t>(now - static_cast<uint32_t>(lastFlushCheck_));
    lastFlushCheck_ = static_cast<int32_t>(now);
    return elapsed > 5;
}

std::list<QUORLOG_LOG_DEVICE_STATISTIC> AccountingManager::HistogramGet() {
    return histogram_;
}

void AccountingManager::AccountingDump() {
    Debuger::MSG(2, "======Accounting Status dump======");
    Debuger::MSG(2, "Total: " + ullNumberToString(totalCount_));
    Debuger::MSG(2, "EPS: " + ullNumberToString(curEps_));
    for (const QUORLOG_LOG_DEVICE_STATISTIC& row : histogram_) {
        Debuger::MSG(2, "Device: " + row.device + ", count: " + ullNumberToString(row.count));
    }
    Debuger::MSG(2, "==================================");
}
