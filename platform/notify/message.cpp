#include "platform/notify/message.h"

#include <unistd.h>

#include <algorithm>
#include <ctime>
#include <iomanip>
#include <locale>
#include <sstream>

#include "base/json.h"
#include "base/utf8.h"
#include "base/words.h"

namespace quor::notify {
namespace {

constexpr size_t kPlainSubjectBytes = 60;
constexpr size_t kEncodedWordBytes = 45;  // 60 in base64, 72 with the word's frame: below the limit of 75
constexpr size_t kBase64LineBytes = 57;   // 76 in base64

bool isPlainSubject(const std::string& subject) {
    for (const char c : subject) {
        if (c < 0x20 || c > 0x7E) {
            return false;
        }
    }
    return subject.size() <= kPlainSubjectBytes && subject.find("=?") == std::string::npos;
}

std::string base64(std::string_view bytes) {
    constexpr std::string_view kDigits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    for (; !bytes.empty(); bytes.remove_prefix(bytes.size() < 3 ? bytes.size() : 3)) {
        uint32_t group = 0;
        for (size_t i = 0; i < 3; ++i) {
            group = group << 8U | (i < bytes.size() ? static_cast<uint8_t>(bytes[i]) : 0U);
        }
        for (size_t i = 0; i < 4; ++i) {
            text += i <= bytes.size() ? kDigits[group >> (18U - 6U * i) & 63U] : '=';
        }
    }
    return text;
}

// Encoded words, one a line; each holds whole characters.
std::string encodedSubject(std::string_view subject) {
    std::string encoded;
    while (!subject.empty()) {
        size_t size = 0;
        while (size < subject.size() && size + NextSymbol(subject, size).length <= kEncodedWordBytes) {
            size += NextSymbol(subject, size).length;
        }
        encoded += (encoded.empty() ? "=?UTF-8?B?" : "\r\n =?UTF-8?B?") + base64(subject.substr(0, size)) + "?=";
        subject.remove_prefix(size);
    }
    return encoded;
}

// Independent of the locale, in UTC.
std::string mailDate(int64_t seconds) {
    const auto clock = static_cast<time_t>(seconds);
    tm utc{};
    (void)gmtime_r(&clock, &utc);  // it fails for years that no clock shows
    std::ostringstream date;
    date.imbue(std::locale::classic());
    date << std::put_time(&utc, "%a, %d %b %Y %H:%M:%S +0000");
    return date.str();
}

std::string messageId() {
    timespec now{};
    (void)clock_gettime(CLOCK_REALTIME, &now);
    return std::to_string(now.tv_sec) + "." + std::to_string(now.tv_nsec) + "." + std::to_string(getpid()) +
           "@quornotify.invalid";
}

std::string base64Lines(std::string_view bytes) {
    std::string lines;
    for (; !bytes.empty(); bytes.remove_prefix(std::min(bytes.size(), kBase64LineBytes))) {
        lines += base64(bytes.substr(0, kBase64LineBytes)) + "\r\n";
    }
    return lines;
}

std::string joined(const std::vector<std::string>& items, const char* separator) {
    std::string text;
    for (const std::string& item : items) {
        text += (text.empty() ? "" : separator) + item;
    }
    return text;
}

bool isAddress(std::string_view text) {
    for (const char c : text) {
        if (c < 0x21 || c > 0x7E || c == '<' || c == '>' || c == '"') {
            return false;
        }
    }
    return text.find('@') != std::string_view::npos;
}

std::vector<std::string> addresses(const char* list) {
    std::vector<std::string> found;
    EachWord(list, ",; \t", [&found](std::string_view word) {
        if (isAddress(word)) {
            found.emplace_back(word);
        }
    });
    return found;
}

}  // namespace

std::vector<std::string> Recipients(const QUORMAIL& mail) {
    return addresses(mail.recipient);
}

// The first recipient stands in for a sender that is not set.
std::string Sender(const QUORMAIL& mail) {
    for (const char* list : {mail.sender, mail.recipient}) {
        const std::vector<std::string> found = addresses(list);
        if (!found.empty()) {
            return found.front();
        }
    }
    return "";
}

std::string HeldBackLine(const Notice& notice) {
    return notice.heldBack > 0
               ? "\nEarlier notices of this kind that were held back: " + std::to_string(notice.heldBack)
               : "";
}

// A body that is not UTF-8 goes out as Latin-1, which has a character for every byte: either way the bytes in the mail
// are those that were received, and a reader sees them.
std::string NoticeAsMail(const QUORMAIL& mail, const Notice& notice) {
    const std::string held = HeldBackLine(notice);
    const std::string body = notice.body + (held.empty() ? "" : held + "\n");
    const std::string& subject = notice.subject;
    return "Date: " + mailDate(notice.time) + "\r\nFrom: <" + Sender(mail) + ">\r\nTo: <" +
           joined(Recipients(mail), ">,\r\n <") + ">\r\nMessage-ID: <" + messageId() +
           ">\r\nSubject: " + (isPlainSubject(subject) ? subject : encodedSubject(subject)) +
           "\r\nMIME-Version: 1.0\r\nContent-Type: text/plain; charset=" + (IsUtf8(body) ? "utf-8" : "iso-8859-1") +
           "\r\nContent-Transfer-Encoding: base64\r\nAuto-Submitted: auto-generated\r\n\r\n" + base64Lines(body);
}

std::string NoticeAsJson(const Notice& notice) {
    std::string json = "{\"tag\":" + JsonString(notice.tag) + ",\"class\":" + JsonString(notice.className) +
                       ",\"time\":" + std::to_string(notice.time) + ",\"host\":" + JsonString(notice.host) +
                       ",\"subject\":" + JsonString(notice.subject) + ",\"body\":" + JsonString(notice.body) +
                       ",\"suppressed\":" + std::to_string(notice.heldBack);
    if (!IsUtf8(notice.body)) {
        json += R"(,"bodyBase64":)" + JsonString(base64(notice.body));
    }
    return json + "}";
}

}  // namespace quor::notify
