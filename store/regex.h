// Regular expressions over messages, in time that grows with the message alone, whatever the expression.
#ifndef STORE_REGEX_H
#define STORE_REGEX_H

#include <string>

#include "common/handles.h"

namespace quor::store {

// Failure, which names `option`, for a pattern with a fault.
void CheckRegex(const std::string& pattern, bool ignoreCase, const std::string& option);
// The pattern as REGEXP takes it.
std::string RegexOf(const std::string& pattern, bool ignoreCase);

// From now on statements of the connection know `text REGEXP 'pattern'`: null for a text that is null.
void AddRegexp(const Connection& connection);

}  // namespace quor::store

#endif
