// What ends a command early: one line that says what to do, and exit status 2.
#ifndef QUORLOG_FAILURE_H
#define QUORLOG_FAILURE_H

#include <stdexcept>

namespace quor::cli {

// The text is shown to a person as it is: texts of others go through Visible() first.
struct Failure : std::runtime_error {
    using std::runtime_error::runtime_error;
};

// The database did not answer.
struct QueryFailure : Failure {
    using Failure::Failure;
};

enum ExitStatus : int { kDone = 0, kNothing = 1, kFailed = 2 };

}  // namespace quor::cli

#endif
