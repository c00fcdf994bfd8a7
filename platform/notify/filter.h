// What the user's filter file says about the notices of one tag.
#ifndef PLATFORM_NOTIFY_FILTER_H
#define PLATFORM_NOTIFY_FILTER_H

#include <cstdint>
#include <string>

namespace quor::notify {

struct FilterRule {
    uint32_t channels = ~0U;
    int32_t interval = 0;  // seconds between two notices, for each host where the notice has one
};

// A file or section that is absent lets everything through.
FilterRule LoadFilterRule(const char* filterFile, const std::string& tag);

}  // namespace quor::notify

#endif
