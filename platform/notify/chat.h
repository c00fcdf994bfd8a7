// A notice as a message of a chat service.
#ifndef PLATFORM_NOTIFY_CHAT_H
#define PLATFORM_NOTIFY_CHAT_H

#include <cstddef>
#include <string>
#include <string_view>

#include "platform/notify/notice.h"

namespace quor::notify {

// The one JSON field that a service reads, and how long it may be.
struct ChatForm {
    std::string_view field;
    size_t units;  // of UTF-16: whoever counts characters counts no more
};

// Nothing with that name: null.
const ChatForm* FindChatForm(std::string_view field);

// One valid JSON object. Subject and body stand in one block of code, in which nothing a sender wrote begins a mention,
// a link or markup, or ends the block; cut at a character's end where they are too long.
std::string NoticeAsChat(const Notice& notice, const ChatForm& form);

}  // namespace quor::notify

#endif
