// One example of every command and of every option that takes a value, for the help and for what is said of mistakes.
#ifndef QUORLOG_EXAMPLES_H
#define QUORLOG_EXAMPLES_H

#include <string>
#include <string_view>

namespace quor::cli {

// `command`: as "quorlog db check". The whole line; empty when there is none.
std::string ExampleOfCommand(std::string_view command);

// `option`: as "--host". The option with a value; empty when there is none.
std::string ExampleOfOption(std::string_view option);

}  // namespace quor::cli

#endif
