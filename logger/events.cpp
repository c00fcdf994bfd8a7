#include <algorithm>
#include <array>
#include <cstdio>

#include "base/paths.h"
#include "common.h"
#include "common/handles.h"
#include "logger.h"
#include "logger/catalogue.h"

namespace {

using quor::Event;

constexpr std::array<const char*, 3> kLevelNames{"Information", "Warning", "Error"};

int record(Logger& logger, Event event, const std::string& text) {
    if (logger.LogAdd(quor::paths::kEventDb, quor::CatalogueRow(event).level, "SYSTEM", text) < 0) {
        Debuger::MSG(0, "Fail to add log");
        return -1;
    }
    return 0;
}

template <typename... Arguments>
int recordFormatted(Logger& logger, Event event, Arguments... arguments) {
    const quor::PlatformText text(QLIBCStrGet(quor::CatalogueRow(event).format, arguments...));
    return record(logger, event, text.get());
}

}  // namespace

std::string strLevelGet(int level) {
    const bool known = level >= 0 && static_cast<size_t>(level) < kLevelNames.size();
    return known ? kLevelNames[static_cast<size_t>(level)] : "";
}

int szLevelGet(int level, char* buffer, int size) {
    if (buffer == nullptr) {
        return -1;
    }
    (void)snprintf(buffer, static_cast<size_t>(std::max(size, 0)), "%s", strLevelGet(level).c_str());
    return 0;
}

int Logger::LogAddServStart(std::string text) {
    return recordFormatted(*this, Event::ServiceStart, text.c_str());
}

int Logger::LogAddServStop(std::string text) {
    return recordFormatted(*this, Event::ServiceStop, text.c_str());
}

int Logger::LogAddNotifyEps(unsigned long long limit) {
    return recordFormatted(*this, Event::NotifyEps, limit);
}

int Logger::LogAddNotifySev(std::string severity, std::string content) {
    return recordFormatted(*this, Event::NotifySeverity, severity.c_str(), content.c_str());
}

int Logger::LogAddNotifySev(_SYSLOG_DB_PRIORITY_tag priority, std::string content) {
    return LogAddNotifySev(PriorTypeToStr(priority), content);
}

int Logger::LogAddNotifyKw(std::string keyword, std::string content) {
    return recordFormatted(*this, Event::NotifyKeyword, keyword.c_str(), content.c_str());
}

int Logger::LogAddArchStart(std::string database) {
    return recordFormatted(*this, Event::ArchiveStart, database.c_str());
}

int Logger::LogAddArchFinish(std::string database) {
    return recordFormatted(*this, Event::ArchiveFinish, database.c_str());
}

int Logger::LogAddArchFailed(std::string database) {
    return recordFormatted(*this, Event::ArchiveFailed, database.c_str());
}

int Logger::LogAddLogClear(std::string path, std::string user) {
    return record(*this, Event::LogClear, path + " was cleared by " + user);
}

int Logger::LogAddVolFull() {
    return record(*this, Event::VolumeFull, quor::CatalogueRow(Event::VolumeFull).format);
}
