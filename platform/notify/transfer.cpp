#include "platform/notify/transfer.h"

#include <dlfcn.h>

namespace quor::notify {
namespace {

constexpr long kConnectSeconds = 10;
constexpr const char kLibrary[] = "libcurl.so.4";

struct Advice {
    CURLcode code;
    const char* text;
};
constexpr Advice kAdvice[] = {
    {CURLE_COULDNT_RESOLVE_HOST, "check the server's name and this machine's name servers"},
    {CURLE_COULDNT_CONNECT, "check address and port, that the server runs, and that no firewall is between"},
    {CURLE_OPERATION_TIMEDOUT,
     "check address and port, and whether the port begins with TLS (tls) or without (starttls, none)"},
    {CURLE_SSL_CONNECT_ERROR, "check whether this port begins with TLS (smtp_security tls, https) or without"},
    {CURLE_USE_SSL_FAILED,
     "the server offers no STARTTLS here: check smtp_port, or set smtp_security to what it takes"},
    {CURLE_PEER_FAILED_VERIFICATION,
     "check that the certificate is for this name, or set smtp_ca_file or webhook_ca_file to the one that issued it"},
    {CURLE_SSL_CACERT_BADFILE,
     "install ca-certificates, or set smtp_ca_file and webhook_ca_file to files that can be read"},
    {CURLE_LOGIN_DENIED, "check smtp_user and smtp_password"},
    {CURLE_SEND_ERROR, "check smtp_sender and smtp_recipient, and whether the server wants a login (smtp_user)"},
    {CURLE_WEIRD_SERVER_REPLY, "check that the port is that of such a server"},
    {CURLE_URL_MALFORMAT, "check how the address is written"},
};

std::string withAdvice(std::string cause, CURLcode code) {
    for (const Advice& known : kAdvice) {
        if (known.code == code) {
            return cause + "; " + known.text;
        }
    }
    return cause;
}

size_t discard(const char* /*data*/, size_t size, size_t count, void* /*context*/) {
    return size * count;
}

// Null when the library cannot be loaded or lacks the function.
template <typename Function>
void find(void* library, const char* name, Function*& function) {
    function = library != nullptr ? reinterpret_cast<Function*>(dlsym(library, name)) : nullptr;
}

// The library stays until the process ends.
Curl load() {
    (void)dlerror();  // of somebody else
    void* library = dlopen(kLibrary, RTLD_NOW);
    Curl curl;
    find(library, "curl_easy_init", curl.init);
    find(library, "curl_easy_setopt", curl.setopt);
    find(library, "curl_easy_perform", curl.perform);
    find(library, "curl_easy_getinfo", curl.getinfo);
    find(library, "curl_easy_strerror", curl.strerror);
    find(library, "curl_easy_cleanup", curl.cleanup);
    find(library, "curl_slist_append", curl.append);
    find(library, "curl_slist_free_all", curl.freeAll);
    const char* error = dlerror();
    if (error != nullptr) {
        curl.fault = std::string("cannot load libcurl: ") + error;
    }
    return curl;
}

}  // namespace

const Curl& LoadedCurl() {
    static const Curl curl = load();
    return curl;
}

void FreeList(curl_slist* list) {
    LoadedCurl().freeAll(list);
}

void CleanUp(CURL* curl) {
    LoadedCurl().cleanup(curl);
}

std::string Append(CurlList& list, const std::string& text) {
    if (!LoadedCurl().fault.empty()) {
        return LoadedCurl().fault;
    }
    curl_slist* longer = LoadedCurl().append(list.get(), text.c_str());
    if (longer == nullptr) {
        return "no memory";
    }
    (void)list.release();
    list.reset(longer);
    return "";
}

// The environment's proxy settings are the caller's, not this service's.
Transfer::Transfer(const std::string& url, long timeoutSeconds, const Tls& tls)
    : curl_(LoadedCurl().fault.empty() ? LoadedCurl().init() : nullptr) {
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
        return LoadedCurl().fault.empty() ? "libcurl cannot start" : LoadedCurl().fault;
    }
    if (result_ == CURLE_OK) {
        result_ = LoadedCurl().perform(curl_.get());
    }
    if (result_ == CURLE_OK) {
        return "";
    }
    return withAdvice(error_[0] != '\0' ? error_.data() : LoadedCurl().strerror(result_), result_);
}

long Transfer::status() const {
    long code = 0;
    if (curl_) {
        (void)LoadedCurl().getinfo(curl_.get(), CURLINFO_RESPONSE_CODE, &code);
    }
    return code;
}

}  // namespace quor::notify
