#include <unistd.h>

#include <algorithm>
#include <array>
#include <ctime>

#include "platform/notify/notify.h"

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

// Encoded words, one a line; each holds whole characters.
std::string encodedSubject(std::string_view subject) {
    std::string encoded;
    while (!subject.empty()) {
        size_t size = 0;
        for (size_t next = Utf8Length(subject); next != 0 && size + next <= kEncodedWordBytes;
             next = Utf8Length(subject.substr(size))) {
            size += next;
        }
        size = size == 0 ? 1 : size;
        encoded += (encoded.empty() ? "=?UTF-8?B?" : "\r\n =?UTF-8?B?") + Base64(subject.substr(0, size)) + "?=";
        subject.remove_prefix(size);
    }
    return encoded;
}

// Independent of the locale, in UTC.
std::string mailDate(int64_t seconds) {
    static constexpr std::array<const char*, 7> kDays{"Sun", "Mon", "Tue", "Wed", "Thu", "Fri", "Sat"};
    static constexpr std::array<const char*, 12> kMonths{"Jan", "Feb", "Mar", "Apr", "May", "Jun",
                                                         "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
    const auto clock = static_cast<time_t>(seconds);
    tm utc{};
    if (gmtime_r(&clock, &utc) == nullptr) {
        return "Thu, 01 Jan 1970 00:00:00 +0000";
    }
    char text[64];
    (void)snprintf(text, sizeof text, "%s, %02d %s %d %02d:%02d:%02d +0000", kDays[static_cast<size_t>(utc.tm_wday)],
                   utc.tm_mday, kMonths[static_cast<size_t>(utc.tm_mon)], utc.tm_year + 1900, utc.tm_hour, utc.tm_min,
                   utc.tm_sec);
    return text;
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
        lines += Base64(bytes.substr(0, kBase64LineBytes)) + "\r\n";
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

std::vector<std::string> addresses(const char* list) {
    std::vector<std::string> found = Words(list, ",; \t");
    const auto unusable = [](const std::string& address) {
        for (const char c : address) {
            if (c < 0x21 || c > 0x7E || c == '<' || c == '>' || c == '"') {
                return true;
            }
        }
        return address.find('@') == std::string::npos;
    };
    found.erase(std::remove_if(found.begin(), found.end(), unusable), found.end());
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

// A body that is not UTF-8 goes out as Latin-1, which has a character for every byte: either way the bytes in the mail
// are those that were received, and a reader sees them.
std::string NoticeAsMail(const QUORMAIL& mail, const Notice& notice) {
    std::string body = notice.body;
    if (notice.heldBack > 0) {
        body += "\nEarlier notices of this kind that were held back: " + std::to_string(notice.heldBack) + "\n";
    }
    const std::string& subject = notice.subject;
    return "Date: " + mailDate(notice.time) + "\r\nFrom: <" + Sender(mail) + ">\r\nTo: <" +
           joined(Recipients(mail), ">,\r\n <") + ">\r\nMessage-ID: <" + messageId() +
           ">\r\nSubject: " + (isPlainSubject(subject) ? subject : encodedSubject(subject)) +
           "\r\nMIME-Version: 1.0\r\nContent-Type: text/plain; charset=" + (IsUtf8(body) ? "utf-8" : "iso-8859-1") +
           "\r\nContent-Transfer-Encoding: base64\r\nAuto-Submitted: auto-generated\r\n\r\n" + base64Lines(body);
}

std::string NoticeAsJson(const Notice& notice) {
    std::string json = "{\"tag\":" + JsonText(notice.tag) + ",\"class\":" + JsonText(notice.className) +
                       ",\"time\":" + std::to_string(notice.time) + ",\"host\":" + JsonText(notice.host) +
                       ",\"subject\":" + JsonText(notice.subject) + ",\"body\":" + JsonText(notice.body) +
                       ",\"suppressed\":" + std::to_string(notice.heldBack);
    if (!IsUtf8(notice.body)) {
        json += ",\"bodyBase64\":" + JsonText(Base64(notice.body));
    }
    return json + "}";
}

}  // namespace quor::notify
