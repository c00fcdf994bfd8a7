// Why a file may not be used: the folder or the file that refuses, whom it lets in, and how to become one of them.
#ifndef STORE_DENIAL_H
#define STORE_DENIAL_H

#include <string>

namespace quor::store {

// Of a file that we may not read, by its absolute path; one line with what to do.
std::string WhyDenied(const std::string& path);

}  // namespace quor::store

#endif
