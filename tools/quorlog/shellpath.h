// Paths that the library hands to a shell.
#ifndef QUORLOG_SHELLPATH_H
#define QUORLOG_SHELLPATH_H

#include <string>

namespace quor::cli {

// How the path stands in the shell's command line.
enum class Quoting { None, Double };

// Failure when the shell would see more in it than a path.
void RequirePlainPath(const std::string& path, Quoting quoting);

}  // namespace quor::cli

#endif
