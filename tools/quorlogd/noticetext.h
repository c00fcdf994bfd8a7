// Log content made fit for a notice.
#ifndef QUORLOGD_NOTICETEXT_H
#define QUORLOGD_NOTICETEXT_H

#include <string>

#include "store/record.h"

namespace quor {

// The message, cut before the first character that would make its escaped form too long for a notice; a cut one ends in
// a marker.
std::string FitForNotice(const std::string& message);

// What a person wants to see of a match; what surrounds the message only when the keyword stands there.
std::string ContentOf(const store::Record& record, const std::string& keyword = "");

}  // namespace quor

#endif
