// Log content made fit for a notice and for the event log.
#ifndef QUORLOGD_NOTICETEXT_H
#define QUORLOGD_NOTICETEXT_H

#include <string>

namespace quor {

// The message, cut before the first character that would make its escaped form too long for a notice; a cut one ends in
// a marker.
std::string FitForNotice(const std::string& message);

// The text as an SQL literal's content: events are stored unescaped. They also go unescaped into an HTML page, so a "<"
// becomes a look-alike, and control bytes become blanks.
std::string EventText(const std::string& text);

}  // namespace quor

#endif
