// Entries of the event log.
#ifndef STORE_EVENT_H
#define STORE_EVENT_H

#include <string>

namespace quor::store {

// The text as an SQL literal's content: events are stored unescaped. They also go unescaped into an HTML page, so a "<"
// becomes a look-alike, and control bytes become blanks.
std::string EventText(const std::string& text);

// Adds a warning to the event log; a failure goes to the system log. User and text may hold names and texts of
// strangers as they are.
void RecordEvent(const std::string& user, const std::string& text);

}  // namespace quor::store

#endif
