// A notice in the form that a channel sends.
#ifndef PLATFORM_NOTIFY_MESSAGE_H
#define PLATFORM_NOTIFY_MESSAGE_H

#include <string>
#include <vector>

#include "platform/notify/notice.h"
#include "quor/quornotify.h"

namespace quor::notify {

// One valid JSON object on one line, whatever bytes the notice holds. Those that are not UTF-8 are written as the four
// characters \xNN, and such a body stands there in Base64 too, as it was received.
std::string NoticeAsJson(const Notice& notice);

// The whole mail, header and body, with CRLF line ends.
std::string NoticeAsMail(const QUORMAIL& mail, const Notice& notice);

// A line, with the line break before it, for readers of plain text; empty when none was held back.
std::string HeldBackLine(const Notice& notice);

// The recipients; text that cannot be an address is left out.
std::vector<std::string> Recipients(const QUORMAIL& mail);
// Empty when neither the sender nor a recipient is an address.
std::string Sender(const QUORMAIL& mail);

}  // namespace quor::notify

#endif
