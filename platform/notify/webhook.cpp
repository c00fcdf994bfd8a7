#include "platform/notify/chat.h"
#include "platform/notify/delivery.h"
#include "platform/notify/message.h"
#include "platform/notify/transfer.h"

namespace quor::notify {
namespace {

bool isHttp(const std::string& url) {
    return url.rfind("http://", 0) == 0 || url.rfind("https://", 0) == 0;
}

std::string refusal(long status) {
    const std::string cause = "the server answered " + std::to_string(status);
    switch (status) {
    case 400:
    case 415:
    case 422:
        return cause + "; choose the form that it takes: webhook_url, webhook_text_url or webhook_content_url";
    case 401:
    case 403:
    case 404:
    case 410:
        return cause + "; check the address, which may have been withdrawn";
    default:
        return status / 100 == 3 ? cause + "; set the address that it leads to" : cause;
    }
}

// An address may hold a secret, so no cause names it.
std::string post(const Settings& settings, const std::string& url, const std::string& json) {
    if (!isHttp(url)) {
        return "the address of a webhook must begin with http:// or https://";
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
    return cause.empty() && status / 100 != 2 ? refusal(status) : cause;
}

}  // namespace

Outcome DeliverToWebhook(const Settings& settings, const Notice& notice) {
    const size_t blank = notice.target.find(' ');
    if (blank == std::string::npos) {
        return {post(settings, notice.target, NoticeAsJson(notice))};
    }
    const ChatForm* const form = FindChatForm(notice.target.substr(0, blank));
    return {form == nullptr ? "the form of this webhook is not known"
                            : post(settings, notice.target.substr(blank + 1), NoticeAsChat(notice, *form))};
}

}  // namespace quor::notify
