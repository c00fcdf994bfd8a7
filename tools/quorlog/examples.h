// One example of every command and of every option that takes a value, for the help and for what is said of mistakes.
#ifndef QUORLOG_EXAMPLES_H
#define QUORLOG_EXAMPLES_H

#include <string>
#include <string_view>

namespace quor::cli {

// `command`: as "quorlog db check". The whole line; empty when there is none.
std::string ExampleOfCommand(std::string_view command);

// `command`: as "db check"; `option`: as "--host". The option with a value, after the command where others take another
// form of it; empty when there is none.
std::string ExampleOfOption(const std::string& command, const std::string& option);

}  // namespace quor::cli

#endif
