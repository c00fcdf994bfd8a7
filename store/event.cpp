#include "store/event.h"

#include "base/paths.h"
#include "logger.h"

namespace quor::store {

std::string EventText(const std::string& text) {
    std::string safe;
    safe.reserve(text.size());
    for (const char c : text) {
        if (c == '\'') {
            safe += "''";
        } else if (c == '<') {
            safe += "\u2039";
        } else {
            const bool control = static_cast<unsigned char>(c) < ' ' || c == '\x7f';
            safe += control ? ' ' : c;
        }
    }
    return safe;
}

void RecordEvent(const std::string& user, const std::string& text) {
    constexpr int kWarning = 1;
    (void)Logger().LogAdd(paths::kEventDb, kWarning, EventText(user), EventText(text));  // reports its own failure
}

}  // namespace quor::store
