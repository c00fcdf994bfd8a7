// Options that several commands share.
#ifndef QUORLOG_OPTIONS_H
#define QUORLOG_OPTIONS_H

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdint>
#include <memory>
#include <string>

#include "store/failure.h"
#include "store/filter.h"
#include "tools/quorlog/output.h"

namespace quor::cli {

using store::Failure;

struct OutputOptions {
    std::string format = "table";
    bool safeCsv = false;
    bool noPager = false;

    // Colour, visible text, width and pager depend on what standard output is.
    Style style() const;
};

void AddDatabaseOption(CLI::App& command, std::string& db);
void AddTableOption(CLI::App& command, std::string& table);
// `lenient`: as in store::FilterOptions; and regular expressions.
void AddFilterOptions(CLI::App& command, store::FilterOptions& filters, bool lenient);
void AddOutputOptions(CLI::App& command, OutputOptions& output);
// An empty value is a slip, of a script mostly: left out, it would mean every row.
CLI::Option* RefuseEmpty(CLI::Option* option);
// An option that may be given several times.
CLI::Option* AddListOption(CLI::App& command, const std::string& name, store::Names& value, const std::string& help);
void AddYesOption(CLI::App& command, bool& yes);

// Accepts decimal digits that fit 64 bits.
CLI::Option* AddNumberOption(CLI::App& command, const std::string& name, uint64_t& value, const std::string& help);

// A subcommand whose exit status is what `run` returns for its options.
template <typename Options>
CLI::App& AddCommand(CLI::App& parent, const std::string& name, const std::string& help, int& status,
                     void (*setup)(CLI::App&, Options&), int (*run)(const Options&)) {
    CLI::App& command = *parent.add_subcommand(name, help);
    const auto options = std::make_shared<Options>();
    setup(command, *options);
    command.callback([options, run, &status] { status = run(*options); });
    return command;
}

}  // namespace quor::cli

#endif
