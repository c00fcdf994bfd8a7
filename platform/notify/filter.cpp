#include "platform/notify/filter.h"

#include "base/numbers.h"
#include "platform/core/table.h"
#include "platform/notify/channels.h"

namespace quor::notify {

FilterRule LoadFilterRule(const char* filterFile, const std::string& tag) {
    FilterRule rule;
    QLIBSZHASH section;
    QLIBSZHASH* handle = &section;
    if (filterFile == nullptr || QLIBCFileGetSection(filterFile, tag.c_str(), &handle) < 0) {
        return rule;
    }
    if (const QLIBSZHASH::Entry* names = section.find("channels")) {
        rule.channels = ChannelsNamed(names->value);
    }
    rule.interval = ToInt32(QLIBCSzHashGetValue(handle, "interval"));
    return rule;
}

}  // namespace quor::notify
