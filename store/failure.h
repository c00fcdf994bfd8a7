// What ends a request early: one line that says what is wrong and what to do, and a code for those who act on it.
#ifndef STORE_FAILURE_H
#define STORE_FAILURE_H

#include <stdexcept>
#include <string>

namespace quor::store {

enum class Cause {
    Usage,    // the request makes no sense
    Missing,  // there is no such database, table or column
    Denied,   // it may not be read or written
    Busy,     // another program holds it
    Damaged,
    Other,
};

// The text may hold names and texts of strangers as they are: whoever shows it makes them harmless.
class Failure : public std::runtime_error {
  public:
    explicit Failure(const std::string& text, Cause cause = Cause::Usage) : std::runtime_error(text), cause_(cause) {}
    Cause cause() const { return cause_; }

  private:
    Cause cause_;
};

}  // namespace quor::store

#endif
