// parse: text entries become rows.
#include "parser.h"

#include <iostream>

#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/records.h"

namespace quor::cli {
namespace {

void setup(CLI::App& command, OutputOptions& output) {
    AddOutputOptions(command, output);
}

// Counts entries and names the first bad ones.
struct Tally {
    static constexpr uint64_t kNamed = 20;

    uint64_t line = 0;
    uint64_t bad = 0;

    void reject() {
        if (++bad <= kNamed) {
            Complain("line " + std::to_string(line) + ": fewer than twelve fields");
        }
    }
};

int run(const OutputOptions& options) {
    std::ios::sync_with_stdio(false);
    Output out(STDOUT_FILENO);
    RecordSink sink(options.style(), {"logs", ""}, out);
    LogParser parser;
    Tally tally;
    for (std::string entry; std::getline(std::cin, entry);) {
        ++tally.line;
        store::Record record;
        if (parser.ParseSingleEntry(entry, record) == 0) {
            sink.add(record);
        } else {
            tally.reject();
        }
    }
    sink.finish();
    if (tally.bad != 0) {
        throw Failure(std::to_string(tally.bad) + " of " + std::to_string(tally.line) +
                      " lines were not entries; check the template that writes them");
    }
    return tally.line == 0 ? ReportNothing("standard input is empty") : kDone;
}

}  // namespace

void AddParse(CLI::App& app, int& status) {
    AddCommand<OutputOptions>(app, "parse", "Turn text entries on standard input into rows", status, setup, run);
}

}  // namespace quor::cli
