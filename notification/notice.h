// What every notice is made of: a table of placeholder values, perhaps with the content of a log among them.
#ifndef NOTIFICATION_NOTICE_H
#define NOTIFICATION_NOTICE_H

#include <array>
#include <initializer_list>

#include "base/paths.h"
#include "common.h"
#include "common/handles.h"
#include "quor/quornotify.h"

namespace quor {

constexpr int kNoticeTableSize = 1024;

// A placeholder, with the percent signs that templates put around it, and its value.
struct NoticeValue {
    const char* key;
    const char* value;
};

inline void FillNotice(StringTable& table, std::initializer_list<NoticeValue> values) {
    for (const NoticeValue& entry : values) {
        (void)QLIBCSzHashSetValue(Adopt(table), entry.key, entry.value);  // a notice without it beats none
    }
}

// The content of a log, escaped for a JSON string, within 2,048 bytes with its terminator.
struct EscapedContent {
    std::array<char, 2048> text{};

    bool escape(const char* content) { return EncodeJson(content, text.data(), static_cast<int>(text.size())) >= 0; }
};

inline int SendNotice(const char* tag, QLIBSZHASH* table) {
    return QUORSysNotifySendNotificationCustomized(tag, paths::kNotifyTexts, paths::kNotifyFilter, table, 0);
}

}  // namespace quor

#endif
