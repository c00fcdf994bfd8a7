#include "platform/notify/delivery.h"

namespace quor::notify {

Outcome DeliverByMail(const Settings& /*settings*/, const Notice& /*notice*/) {
    return {"mail is not built in; build with libcurl (QUOR_WITH_CURL=ON)"};
}

Outcome DeliverToWebhook(const Settings& /*settings*/, const Notice& /*notice*/) {
    return {"webhooks are not built in; build with libcurl (QUOR_WITH_CURL=ON)"};
}

}  // namespace quor::notify
