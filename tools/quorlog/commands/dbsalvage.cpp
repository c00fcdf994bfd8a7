// db salvage.
#include <unistd.h>

#include <cstdio>
#include <iostream>

#include "base/paths.h"
#include "quor/quorsalvage.h"
#include "store/databasefile.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

struct SalvageOptions {
    std::string damaged;
    std::string fresh;
    OutputOptions output;
};

void setup(CLI::App& command, SalvageOptions& options) {
    command.add_option("damaged", options.damaged, "The damaged database; it is only read")->required();
    command.add_option("new", options.fresh, "The database to create")->required();
    AddOutputOptions(command, options.output);
}

int showProgress(unsigned long long done, unsigned long long pages, void* /*context*/) {
    constexpr unsigned long long kWidth = 40;
    const std::string bar(static_cast<size_t>(pages > 0 ? done * kWidth / pages : kWidth), '#');
    (void)fprintf(stderr, "\r[%-40s] %llu of %llu pages", bar.c_str(), done, pages);
    return 0;
}

std::string tablesOf(const QUORSALVAGE& report, uint64_t& rows) {
    std::string names;
    for (int i = 0; i < report.tableCount; ++i) {
        const QUORSALVAGETABLE& table = report.tables[i];
        names += (names.empty() ? "" : ", ") + std::string(table.name) + " " + std::to_string(table.rows);
        rows += table.rows;
    }
    return names;
}

Value number(const char* name, uint64_t value) {
    return {name, std::to_string(value), Kind::Number};
}

int run(const SalvageOptions& options) {
    const std::string damaged = store::RequireDatabase(options.damaged, "name the file that was moved aside");
    const std::string fresh = store::AbsolutePath(options.fresh);
    const char* const schemas[] = {paths::kLogSchema, paths::kEventSchema, paths::kAccountingSchema, nullptr};
    const bool watched = isatty(STDERR_FILENO) != 0;
    QUORSALVAGE report;
    const int result =
        QUORDBSalvage(damaged.c_str(), fresh.c_str(), schemas, watched ? showProgress : nullptr, nullptr, &report);
    if (watched) {
        std::cerr << (result == 0 ? "\n" : "\r\x1b[K");
    }
    if (result != 0) {
        throw Failure(report.error, store::Cause::Other);
    }
    uint64_t rows = 0;
    const std::string tables = tablesOf(report, rows);
    Output out(STDOUT_FILENO);
    WriteRecord(options.output.style(),
                {{"path", fresh},
                 {"tables", tables},
                 {"definitions", report.schemaRead != 0 ? "from the damaged file" : "from the package"},
                 number("rows", rows),
                 number("pages", report.pages),
                 number("bad_pages", report.badPages),
                 number("bad_rows", report.badRows),
                 number("stray_rows", report.strayRows),
                 number("duplicates", report.duplicates),
                 number("unknown_rows", report.unknownRows)},
                out);
    return rows == 0 ? ReportNothing("no rows could be saved") : kDone;
}

}  // namespace

void AddDbSalvage(CLI::App& db, int& status) {
    AddCommand<SalvageOptions>(db, "salvage", "Save the rows of a damaged database into a new one", status, setup, run);
}

}  // namespace quor::cli
