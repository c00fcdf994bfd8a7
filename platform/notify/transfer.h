// One libcurl transfer with the bounds that every delivery has.
#ifndef PLATFORM_NOTIFY_TRANSFER_H
#define PLATFORM_NOTIFY_TRANSFER_H

#include <curl/curl.h>

#include <array>
#include <string>

#include "base/guards.h"

namespace quor::notify {

using CurlList = std::unique_ptr<curl_slist, Releaser<curl_slist_free_all>>;

// False when there is no memory.
bool Append(CurlList& list, const std::string& text);

struct Tls {
    const char* caFile;  // empty: the system's certificates
    bool verify;
};

class Transfer {
  public:
    Transfer(const std::string& url, long timeoutSeconds, const Tls& tls);

    template <typename Value>
    void set(CURLoption option, Value value) {
        if (curl_ && result_ == CURLE_OK) {
            result_ = curl_easy_setopt(curl_.get(), option, value);
        }
    }

    // The cause of the failure; empty when all went well.
    std::string run();
    // The server's answer to HTTP; 0 when there was none.
    long status() const;

  private:
    std::unique_ptr<CURL, Releaser<curl_easy_cleanup>> curl_;
    CURLcode result_ = CURLE_OK;
    std::array<char, CURL_ERROR_SIZE> error_{};
};

}  // namespace quor::notify

#endif
