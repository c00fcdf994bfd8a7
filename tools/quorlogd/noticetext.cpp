#include "tools/quorlogd/noticetext.h"

namespace {

constexpr size_t kNoticeBytes = 2047;  // the escaped form, without its terminator
constexpr const char kMarker[] = " [...]";

size_t escapedSize(char c) {
    return c == '"' || c == '\\' ? 2 : 1;
}

bool isContinuation(char c) {
    return (static_cast<unsigned char>(c) & 0xC0U) == 0x80;
}

// How many bytes of the text fit, escaped, into `room`.
size_t fitting(const std::string& text, size_t room) {
    size_t pos = 0;
    for (size_t used = 0; pos < text.size(); ++pos) {
        used += escapedSize(text[pos]);
        if (used > room) {
            break;
        }
    }
    return pos;
}

// Keeps characters of several bytes whole, within reason for text that is not UTF-8.
size_t characterStart(const std::string& text, size_t pos) {
    size_t start = pos;
    while (start > 0 && pos - start < 3 && isContinuation(text[start])) {
        --start;
    }
    return start;
}

}  // namespace

namespace quor {

std::string FitForNotice(const std::string& message) {
    if (fitting(message, kNoticeBytes) == message.size()) {
        return message;
    }
    const size_t kept = fitting(message, kNoticeBytes - (sizeof(kMarker) - 1));
    return message.substr(0, characterStart(message, kept)) + kMarker;
}

std::string ContentOf(const store::Record& record, const std::string& keyword) {
    const std::string program = record.prog + (record.pid.empty() ? "" : "[" + record.pid + "]");
    const bool inMessage = record.msg.find(keyword) != std::string::npos;
    const std::string around = inMessage ? "" : " " + record.msgid + " " + record.sdata;
    return FitForNotice(record.ldate + " " + record.ltime + " " + program + ": " + record.msg + around);
}

}  // namespace quor
