// One libcurl transfer with the bounds that every delivery has.
//
// libcurl is loaded by the process that delivers and by nobody else. It brings some thirty libraries, and a program
// that was linked with them would take several times as long to start as a search takes.
#ifndef PLATFORM_NOTIFY_TRANSFER_H
#define PLATFORM_NOTIFY_TRANSFER_H

#include <curl/curl.h>

#include <array>
#include <string>

#include "base/guards.h"

namespace quor::notify {

struct Curl {
    decltype(curl_easy_init)* init = nullptr;
    decltype(curl_easy_setopt)* setopt = nullptr;
    decltype(curl_easy_perform)* perform = nullptr;
    decltype(curl_easy_getinfo)* getinfo = nullptr;
    decltype(curl_easy_strerror)* strerror = nullptr;
    decltype(curl_easy_cleanup)* cleanup = nullptr;
    decltype(curl_slist_append)* append = nullptr;
    decltype(curl_slist_free_all)* freeAll = nullptr;
    std::string fault;  // why there is none; empty when all of them are there
};

// Loads it with the first call.
const Curl& LoadedCurl();

void FreeList(curl_slist* list);
void CleanUp(CURL* curl);

using CurlList = Guard<curl_slist, FreeList>;

// The cause of the failure; empty when it was appended.
std::string Append(CurlList& list, const std::string& text);

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
            result_ = LoadedCurl().setopt(curl_.get(), option, value);
        }
    }

    // The cause of the failure, and what to do about it; empty when all went well.
    std::string run();
    // The server's answer to HTTP; 0 when there was none.
    long status() const;

  private:
    Guard<CURL, CleanUp> curl_;
    CURLcode result_ = CURLE_OK;
    std::array<char, CURL_ERROR_SIZE> error_{};
};

}  // namespace quor::notify

#endif
