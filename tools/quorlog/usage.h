// What somebody is told who asks for help, or whose command line cannot be understood.
#ifndef QUORLOG_USAGE_H
#define QUORLOG_USAGE_H

#include <CLI/CLI.hpp>
#include <memory>
#include <string>

namespace quor::cli {

// Help in lines of at most 80 columns.
std::shared_ptr<CLI::Formatter> MakeHelp();

// One line that names what is wrong, and an example of what is right.
std::string Explain(const CLI::App& app, const CLI::ParseError& error);

}  // namespace quor::cli

#endif
