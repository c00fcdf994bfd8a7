#include <algorithm>
#include <cstring>

#include "platform/notify/delivery.h"
#include "platform/notify/message.h"
#include "platform/notify/transfer.h"

namespace quor::notify {
namespace {

struct Upload {
    std::string_view rest;
};

size_t readUpload(char* out, size_t size, size_t count, void* context) {
    std::string_view& rest = static_cast<Upload*>(context)->rest;
    const size_t given = std::min(size * count, rest.size());
    memcpy(out, rest.data(), given);
    rest.remove_prefix(given);
    return given;
}

std::string urlOf(const QUORMAIL& mail) {
    const std::string server = mail.server;
    const bool ipv6 = server.find(':') != std::string::npos;
    return (mail.security == kTls ? "smtps://" : "smtp://") + (ipv6 ? "[" + server + "]" : server) + ":" +
           std::to_string(mail.port);
}

bool isHostName(const std::string& server) {
    return server.find_first_of("/@?#[]% \t\\") == std::string::npos;
}

void logIn(Transfer& transfer, const QUORMAIL& mail) {
    if (mail.user[0] != '\0') {
        transfer.set(CURLOPT_USERNAME, mail.user);
        transfer.set(CURLOPT_PASSWORD, mail.password);
    }
}

// One recipient that the server refuses does not cost the others their mail.
void allowRefusedRecipients(Transfer& transfer) {
#if LIBCURL_VERSION_NUM >= 0x080200
    transfer.set(CURLOPT_MAIL_RCPT_ALLOWFAILS, 1L);
#elif LIBCURL_VERSION_NUM >= 0x074500
    transfer.set(CURLOPT_MAIL_RCPT_ALLLOWFAILS, 1L);
#else
    (void)transfer;
#endif
}

}  // namespace

Outcome DeliverByMail(const Settings& settings, const Notice& notice) {
    const QUORMAIL& mail = settings.mail;
    CurlList recipients;
    for (const std::string& address : Recipients(mail)) {
        const std::string cause = Append(recipients, "<" + address + ">");
        if (!cause.empty()) {
            return {cause};
        }
    }
    if (!recipients || !isHostName(mail.server)) {
        return {"check smtp_server and smtp_recipient in the settings"};
    }
    const std::string message = NoticeAsMail(mail, notice);
    const std::string sender = "<" + Sender(mail) + ">";
    Upload upload{message};
    Transfer transfer(urlOf(mail), settings.timeout, {mail.caFile, mail.verify != 0});
    transfer.set(CURLOPT_USE_SSL, static_cast<long>(mail.security == kStartTls ? CURLUSESSL_ALL : CURLUSESSL_NONE));
    logIn(transfer, mail);
    allowRefusedRecipients(transfer);
    transfer.set(CURLOPT_MAIL_FROM, sender.c_str());
    transfer.set(CURLOPT_MAIL_RCPT, recipients.get());
    transfer.set(CURLOPT_UPLOAD, 1L);
    transfer.set(CURLOPT_READFUNCTION, readUpload);
    transfer.set(CURLOPT_READDATA, static_cast<void*>(&upload));
    return {transfer.run()};
}

}  // namespace quor::notify
