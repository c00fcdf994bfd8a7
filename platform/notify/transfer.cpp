#include "platform/notify/transfer.h"

namespace quor::notify {
namespace {

constexpr long kConnectSeconds = 10;

size_t discard(const char* /*data*/, size_t size, size_t count, void* /*context*/) {
    return size * count;
}

}  // namespace

bool Append(CurlList& list, const std::string& text) {
    curl_slist* longer = curl_slist_append(list.get(), text.c_str());
    if (longer == nullptr) {
        return false;
    }
    (void)list.release();
    list.reset(longer);
    return true;
}

// The environment's proxy settings are the caller's, not this service's.
Transfer::Transfer(const std::string& url, long timeoutSeconds, const Tls& tls) : curl_(curl_easy_init()) {
    set(CURLOPT_URL, url.c_str());
    set(CURLOPT_PROXY, "");
    set(CURLOPT_ERRORBUFFER, error_.data());
    set(CURLOPT_WRITEFUNCTION, discard);
    set(CURLOPT_CONNECTTIMEOUT, timeoutSeconds < kConnectSeconds ? timeoutSeconds : kConnectSeconds);
    set(CURLOPT_TIMEOUT, timeoutSeconds);
    set(CURLOPT_SSL_VERIFYPEER, tls.verify ? 1L : 0L);
    set(CURLOPT_SSL_VERIFYHOST, tls.verify ? 2L : 0L);
    if (*tls.caFile != '\0') {
        set(CURLOPT_CAINFO, tls.caFile);
    }
}

std::string Transfer::run() {
    if (!curl_) {
        return "libcurl cannot start";
    }
    if (result_ == CURLE_OK) {
        result_ = curl_easy_perform(curl_.get());
    }
    if (result_ == CURLE_OK) {
        return "";
    }
    return error_[0] != '\0' ? error_.data() : curl_easy_strerror(result_);
}

long Transfer::status() const {
    long code = 0;
    (void)curl_easy_getinfo(curl_.get(), CURLINFO_RESPONSE_CODE, &code);
    return code;
}

}  // namespace quor::notify
