// What a person reads besides rows: lines on standard output, complaints and questions on standard error. Whatever
// stands in them of strangers' texts is made harmless here.
#ifndef QUORLOG_MESSAGES_H
#define QUORLOG_MESSAGES_H

#include <string>

namespace quor::cli {

enum ExitStatus : int { kDone = 0, kNothing = 1, kFailed = 2 };

// One line on standard output.
void WriteLine(const std::string& line);

// "quorlog: " and the text, on standard error.
void Complain(const std::string& text);

// Says that nothing was found, and why. The exit status that tells it.
int ReportNothing(const std::string& why);

// Asks on standard error; true for "y" or "yes". Failure when standard input has no answer.
bool Confirm(const std::string& question);

}  // namespace quor::cli

#endif
