#include "platform/notify/delivery.h"
#include "platform/notify/message.h"
#include "platform/notify/transfer.h"

namespace quor::notify {
namespace {

bool isHttp(const std::string& url) {
    return url.rfind("http://", 0) == 0 || url.rfind("https://", 0) == 0;
}

// An address may hold a secret, so no cause names it.
std::string post(const Settings& settings, const std::string& url, const std::string& json) {
    if (!isHttp(url)) {
        return "webhook_url must begin with http:// or https://";
    }
    CurlList headers;
    for (const char* header : {"Content-Type: application/json", "Expect:"}) {
        std::string cause = Append(headers, header);
        if (!cause.empty()) {
            return cause;
        }
    }
    Transfer transfer(url, settings.timeout, {settings.webhookCaFile.c_str(), settings.webhookVerify});
    transfer.set(CURLOPT_HTTPHEADER, headers.get());
    transfer.set(CURLOPT_POSTFIELDSIZE, static_cast<long>(json.size()));
    transfer.set(CURLOPT_POSTFIELDS, json.c_str());
    const std::string cause = transfer.run();
    const long status = transfer.status();
    return cause.empty() && status / 100 != 2 ? "the server answered " + std::to_string(status) : cause;
}

}  // namespace

std::string DeliverToWebhook(const Settings& settings, const Notice& notice) {
    return post(settings, notice.target, NoticeAsJson(notice));
}

}  // namespace quor::notify
