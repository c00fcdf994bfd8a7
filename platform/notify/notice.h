// One notice, from its rendering to its delivery. The caller's process renders it, asks the filter, and queues it in
// the spool for each place that it goes to; detached workers take it from there and deliver it. Only the spool is
// shared between the processes, so all of them run as the same user.
#ifndef PLATFORM_NOTIFY_NOTICE_H
#define PLATFORM_NOTIFY_NOTICE_H

#include <cstdint>
#include <string>

namespace quor::notify {

struct Notice {
    std::string tag;
    std::string className;  // the desktop application that it belongs to; may be empty
    std::string host;       // empty when the notice has none
    std::string subject;    // one line of valid UTF-8 without control characters
    std::string body;       // log content stands in it byte for byte, as it was received
    int64_t time = 0;
    uint32_t heldBack = 0;  // earlier notices that the filter or a full queue held back
    std::string target;     // the one of its channel's targets that it goes to
};

}  // namespace quor::notify

#endif
