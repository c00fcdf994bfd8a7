// Templates and the values that fill them.
#ifndef PLATFORM_NOTIFY_RENDER_H
#define PLATFORM_NOTIFY_RENDER_H

#include <optional>
#include <string>

#include "platform/notify/notice.h"
#include "quor/quorcore.h"

namespace quor::notify {

// Fills tag, class, host, subject and body. Nothing when the template is missing or has no subject.
std::optional<Notice> Render(const std::string& tag, const std::string& textsDir, QLIBSZHASH* values);

}  // namespace quor::notify

#endif
