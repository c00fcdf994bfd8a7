// The delivery of one notice on each channel: the cause of the failure, empty when it was delivered. Without libcurl
// mail and webhooks fail.
#ifndef PLATFORM_NOTIFY_DELIVERY_H
#define PLATFORM_NOTIFY_DELIVERY_H

#include <string>

#include "platform/notify/notice.h"
#include "platform/notify/settings.h"

namespace quor::notify {

std::string DeliverToDesktop(const Settings& settings, const Notice& notice);
std::string DeliverByMail(const Settings& settings, const Notice& notice);
std::string DeliverToWebhook(const Settings& settings, const Notice& notice);

}  // namespace quor::notify

#endif
