// Log content made fit for a notice.
#ifndef QUORLOGD_NOTICETEXT_H
#define QUORLOGD_NOTICETEXT_H

#include <string>

namespace quor {

// The message, cut before the first character that would make its escaped form too long for a notice; a cut one ends in
// a marker.
std::string FitForNotice(const std::string& message);

}  // namespace quor

#endif
