// archive write, extract, info, list, verify.
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <iostream>
#include <optional>

#include "base/paths.h"
#include "quor/quorarchive.h"
#include "store/databasefile.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/deeds.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"

namespace quor::cli {
namespace {

namespace fs = std::filesystem;

struct ArchiveOptions {
    std::string archive;
    std::string source;
    std::optional<std::string> compared;
    std::string target;
    OutputOptions output;
};

void addArchive(CLI::App& command, ArchiveOptions& options) {
    command.add_option("archive", options.archive, "The archive")->type_name("PATH")->required();
}

void setupWrite(CLI::App& command, ArchiveOptions& options) {
    command.add_option("from", options.source, "The log database; it is only read")->type_name("PATH")->required();
    command.add_option("to", options.target, "The archive to create")->type_name("PATH")->required();
}

void setupExtract(CLI::App& command, ArchiveOptions& options) {
    addArchive(command, options);
    command.add_option("to", options.target, "The log database to create")->type_name("PATH")->required();
}

void setupInfo(CLI::App& command, ArchiveOptions& options) {
    addArchive(command, options);
    AddOutputOptions(command, options.output);
}

void setupList(CLI::App& command, ArchiveOptions& options) {
    command.add_option("folder", options.archive, "The folder with the archives")->type_name("PATH")->required();
    AddOutputOptions(command, options.output);
}

void setupVerify(CLI::App& command, ArchiveOptions& options) {
    addArchive(command, options);
    command.add_option("source", options.compared, "The log database that it was made of, to compare all rows")
        ->type_name("PATH");
}

int showProgress(unsigned long long done, unsigned long long rows, void* /*context*/) {
    constexpr unsigned long long kWidth = 40;
    const std::string bar(static_cast<size_t>(rows > 0 ? done * kWidth / rows : kWidth), '#');
    (void)fprintf(stderr, "\r[%-40s] %llu of %llu rows", bar.c_str(), done, rows);
    return 0;
}

// The way that a long deed shows on a terminal.
class Watch {
  public:
    Watch(const Watch&) = delete;
    Watch& operator=(const Watch&) = delete;
    Watch() = default;
    ~Watch() {
        if (watched_) {
            std::cerr << "\r\x1b[K";
        }
    }
    QUORARCHIVEPROGRESS progress() const { return watched_ ? showProgress : nullptr; }

  private:
    bool watched_ = isatty(STDERR_FILENO) != 0;
};

void require(int result, const QUORARCHIVE& report) {
    if (result != 0) {
        throw Failure(report.error, report.damagedBlocks != 0 ? store::Cause::Damaged : store::Cause::Other);
    }
}

std::string rowsOf(const QUORARCHIVE& report) {
    return std::to_string(report.rows) + (report.rows == 1 ? " row" : " rows");
}

std::string share(uint64_t part, uint64_t whole) {
    char text[32];
    (void)snprintf(text, sizeof text, "%.1f",
                   whole > 0 ? static_cast<double>(part) * 100 / static_cast<double>(whole) : 0);
    return text;
}

int runWrite(const ArchiveOptions& options) {
    const std::string source = store::RequireLogDatabase(options.source);
    const std::string target = store::AbsolutePath(options.target);
    QUORARCHIVE report;
    {
        const Watch watch;
        require(QUORArchiveWrite(source.c_str(), target.c_str(), watch.progress(), nullptr, &report), report);
    }
    WriteLine("archived " + rowsOf(report) + " in " + target + ", which takes " +
              share(report.bytes, store::SizeOf(source)) + "% of the database");
    RecordDeed("Archived " + source + " as " + target);
    return kDone;
}

int runExtract(const ArchiveOptions& options) {
    const std::string archive = store::RequireLogDatabase(options.archive);
    const std::string target = store::AbsolutePath(options.target);
    QUORARCHIVE report;
    require(QUORArchiveExtract(archive.c_str(), target.c_str(), &report), report);
    WriteLine("extracted " + rowsOf(report) + " to " + target);
    if (report.damagedBlocks != 0) {
        Complain(std::to_string(report.damagedRows) + " rows are in damaged blocks and were left out; restore the "
                                                      "archive from a copy to have them");
        return kFailed;
    }
    return kDone;
}

Value number(const char* name, uint64_t value) {
    return {name, std::to_string(value), Kind::Number};
}

int runInfo(const ArchiveOptions& options) {
    const std::string archive = store::RequireLogDatabase(options.archive);
    QUORARCHIVE report;
    require(QUORArchiveInfo(archive.c_str(), &report), report);
    char checksum[24];
    (void)snprintf(checksum, sizeof checksum, "%016llx", report.checksum);
    Output out(STDOUT_FILENO);
    WriteRecord(options.output.style(),
                {{"path", archive},
                 number("bytes", report.bytes),
                 number("rows", report.rows),
                 number("blocks", report.blocks),
                 {"first_id", std::to_string(report.firstId), Kind::Number},
                 {"last_id", std::to_string(report.lastId), Kind::Number},
                 {"first_day", report.firstDate},
                 {"last_day", report.lastDate},
                 {"checksum", checksum}},
                out);
    return kDone;
}

// The archives of a folder, by their names.
std::vector<std::string> archivesIn(const std::string& folder) {
    std::vector<std::string> found;
    std::error_code problem;
    for (const fs::directory_entry& entry : fs::directory_iterator(folder, problem)) {
        std::error_code ignored;
        if (entry.is_regular_file(ignored) && QUORArchiveIs(entry.path().c_str()) == 1) {
            found.push_back(entry.path());
        }
    }
    if (problem) {
        throw Failure("cannot read " + folder + ": " + problem.message() + "; name the folder with the archives",
                      store::Cause::Missing);
    }
    std::sort(found.begin(), found.end());
    return found;
}

int runList(const ArchiveOptions& options) {
    const std::string folder = store::AbsolutePath(options.archive);
    const std::vector<std::string> archives = archivesIn(folder);
    if (archives.empty()) {
        return ReportNothing("no archive in " + folder);
    }
    Output out(STDOUT_FILENO);
    const auto sink =
        MakeSink(options.output.style(),
                 {{"name"}, {"first_day"}, {"last_day"}, {"rows", Kind::Number}, {"bytes", Kind::Number}}, out);
    int status = kDone;
    for (const std::string& archive : archives) {
        QUORARCHIVE report;
        if (QUORArchiveInfo(archive.c_str(), &report) != 0) {
            Complain(archive + ": " + report.error);
            status = kFailed;
            continue;
        }
        const std::string name = fs::path(archive).filename();
        const std::string rows = std::to_string(report.rows);
        const std::string bytes = std::to_string(report.bytes);
        sink->row({name, report.firstDate, report.lastDate, rows, bytes});
    }
    sink->finish();
    return status;
}

int runVerify(const ArchiveOptions& options) {
    const std::string archive = store::RequireLogDatabase(options.archive);
    const std::string source = options.compared ? store::RequireLogDatabase(*options.compared) : "";
    QUORARCHIVE report;
    {
        const Watch watch;
        require(QUORArchiveCheck(archive.c_str(), source.empty() ? nullptr : source.c_str(), watch.progress(), nullptr,
                                 &report),
                report);
    }
    WriteLine(archive + " is sound: " + rowsOf(report) + (source.empty() ? "" : ", those of " + source));
    return kDone;
}

}  // namespace

void AddArchive(CLI::App& app, int& status) {
    CLI::App& archive = *app.add_subcommand("archive", "Keep log databases in an eighth of their size");
    archive.require_subcommand(1);
    AddCommand<ArchiveOptions>(archive, "write", "Write a log database as an archive", status, setupWrite, runWrite);
    AddCommand<ArchiveOptions>(archive, "extract", "Make a log database of an archive", status, setupExtract,
                               runExtract);
    AddCommand<ArchiveOptions>(archive, "info", "Print the size, rows and days of an archive", status, setupInfo,
                               runInfo);
    AddCommand<ArchiveOptions>(archive, "list", "List the archives of a folder", status, setupList, runList);
    AddCommand<ArchiveOptions>(archive, "verify", "Read every row of an archive and compare", status, setupVerify,
                               runVerify);
}

}  // namespace quor::cli
