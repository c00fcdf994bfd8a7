#include "platform/notify/delivery.h"

namespace quor::notify {

std::string DeliverByMail(const Settings& /*settings*/, const Notice& /*notice*/) {
    return "mail is not built in; build with libcurl (QUOR_WITH_CURL=ON)";
}

std::string DeliverToWebhook(const Settings& /*settings*/, const Notice& /*notice*/) {
    return "webhooks are not built in; build with libcurl (QUOR_WITH_CURL=ON)";
}

}  // namespace quor::notify
