#include "tools/quorlogd/announce.h"

#include "common/handles.h"
#include "notification.h"
#include "store/event.h"

namespace quor {

void RecordEvent(const std::string& text) {
    store::RecordEvent("SYSTEM", "Event detection: " + text);
}

void SendNotice(const char* tag, const std::map<std::string, std::string>& values) {
    StringTable table(QLIBCSzHashAlloc(16));
    for (const auto& [key, value] : values) {
        (void)QLIBCSzHashSetValue(Adopt(table), key.c_str(), value.c_str());
    }
    std::string name = tag;
    (void)NotificationManager().NotificationSend(name.data(), Adopt(table));
}

}  // namespace quor
