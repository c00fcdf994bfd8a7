// The events of the package: their levels and texts.
#ifndef LOGGER_CATALOGUE_H
#define LOGGER_CATALOGUE_H

#include <array>
#include <cstddef>
#include <cstdint>

namespace quor {

enum class Event : int32_t {
    ServiceStart,
    ServiceStop,
    NotifyEps,
    NotifySeverity,
    NotifyKeyword,
    ArchiveStart,
    ArchiveFinish,
    ArchiveFailed,
    LogClear,
    VolumeFull,
};

struct CatalogueEntry {
    Event number;
    int32_t level;
    const char* format;  // printf
};

constexpr std::array<CatalogueEntry, 10> kCatalogue{{
    {Event::ServiceStart, 0, "Server was started [%s]."},
    {Event::ServiceStop, 0, "Server was stopped [%s]."},
    {Event::NotifyEps, 0, "Event detection: EPS is larger than [%llu]."},
    {Event::NotifySeverity, 0, "Event detection: Received log which severity is [%s]. Log content: [%s]"},
    {Event::NotifyKeyword, 0, "Event detection: Received log which contains [%s]. Log content: [%s]"},
    {Event::ArchiveStart, 0, "Log database [%s] starts to archive."},
    {Event::ArchiveFinish, 0, "Log database [%s] has been archived."},
    {Event::ArchiveFailed, 0, "Log database [%s] is failed to archived."},
    {Event::LogClear, 0, "Log was cleared."},
    {Event::VolumeFull, 1, "Volume space is not enough."},
}};

constexpr const CatalogueEntry& CatalogueRow(Event event) {
    return kCatalogue[static_cast<size_t>(event)];
}

constexpr bool CatalogueIsInOrder() {
    for (size_t i = 0; i < kCatalogue.size(); ++i) {
        if (static_cast<size_t>(kCatalogue[i].number) != i) {
            return false;
        }
    }
    return true;
}
static_assert(CatalogueIsInOrder(), "an event's number is its row");

}  // namespace quor

#endif
