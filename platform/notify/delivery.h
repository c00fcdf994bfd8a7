// The delivery of one notice on each channel. Without libcurl mail and webhooks fail.
#ifndef PLATFORM_NOTIFY_DELIVERY_H
#define PLATFORM_NOTIFY_DELIVERY_H

#include <string>

#include "platform/notify/notice.h"
#include "platform/notify/settings.h"

namespace quor::notify {

struct Outcome {
    std::string cause;      // of the failure, and what to do about it; empty when the notice was delivered
    bool hopeless = false;  // another try would fail the same way
};

Outcome DeliverToCommand(const Settings& settings, const Notice& notice);
Outcome DeliverToDesktop(const Settings& settings, const Notice& notice);
Outcome DeliverByMail(const Settings& settings, const Notice& notice);
Outcome DeliverToWebhook(const Settings& settings, const Notice& notice);

}  // namespace quor::notify

#endif
