// db create, info, checkpoint.
#include <sys/stat.h>
#include <unistd.h>

#include <iostream>

#include "commands.h"
#include "common/paths.h"
#include "database.h"
#include "dbhandler.h"
#include "options.h"
#include "records.h"
#include "selection.h"
#include "text.h"

namespace quor::cli {
namespace {

struct DbOptions {
    std::string db = paths::kWorkingDb;
    OutputOptions output;
};

void setup(CLI::App& command, DbOptions& options) {
    AddDatabaseOption(command, options.db);
}

void setupInfo(CLI::App& command, DbOptions& options) {
    setup(command, options);
    AddOutputOptions(command, options.output);
}

// A database handle that is closed again.
class Handle {
  public:
    explicit Handle(const std::string& path) : handler_(path, paths::kLogSchema) {
        if (handler_.DBCon() < 0) {
            throw Failure("cannot open " + Visible(path) + "; see that you may read and write it and its folder");
        }
    }
    Handle(const Handle&) = delete;
    Handle& operator=(const Handle&) = delete;
    ~Handle() { handler_.DBDiscon(); }
    DBHandler* operator->() { return &handler_; }

  private:
    DBHandler handler_;
};

// The library hands the path to a shell inside double quotes.
void checkForShell(const std::string& path) {
    if (path.find_first_of("\"$`\\!\n") != std::string::npos) {
        throw Failure("the path " + Visible(path) +
                      " cannot be used; give one without quotes, $, `, \\, ! and newlines");
    }
}

uint64_t sizeOf(const std::string& path) {
    struct stat status = {};
    return stat(path.c_str(), &status) == 0 ? static_cast<uint64_t>(status.st_size) : 0;
}

int runCreate(const DbOptions& options) {
    const std::string db = AbsolutePath(options.db);
    checkForShell(db);
    struct stat status = {};
    if (lstat(db.c_str(), &status) == 0) {
        throw Failure(Visible(db) + " exists already; move it away or give another --db");
    }
    if (access(paths::kLogSchema, R_OK) != 0 || access(paths::kSqliteShell, X_OK) != 0) {
        throw Failure(std::string("needs ") + paths::kLogSchema + " and " + paths::kSqliteShell + "; install them");
    }
    if (Handle(db)->DBcheckTableExist("logs") != 1) {
        throw Failure("could not create the tables of " + Visible(db) + "; see the system log");
    }
    WriteLine("created " + Visible(db));
    return kDone;
}

int runInfo(const DbOptions& options) {
    std::string db = RequireLogDatabase(options.db);
    Handle handle(db);
    if (handle->DBcheckTableExist("logs") != 1) {
        FailQuery(db, "logs", {});
    }
    _ARCH_DB_INFO_tag info;
    const bool described = handle->DBcheckTableExist("db_info") == 1 && handle->DBInfoGet(info) == 0;
    const uint64_t rows = Count({db, "logs", {}});
    Output out(STDOUT_FILENO);
    WriteRecord(options.output.style(),
                {{"path", db},
                 {"bytes", std::to_string(sizeOf(db)), Kind::Number},
                 {"wal_bytes", std::to_string(sizeOf(db + "-wal")), Kind::Number},
                 {"device", described ? info.device : ""},
                 {"logs", std::to_string(rows), Kind::Number},
                 {"oldest", rows == 0 ? "" : handle->DBInfoStartStrGet()},
                 {"newest", rows == 0 ? "" : handle->DBInfoEndStrGet()}},
                out);
    return kDone;
}

int runCheckpoint(const DbOptions& options) {
    const std::string db = RequireLogDatabase(options.db);
    if (Handle(db)->DBWalCheckpoint(false) != 0) {
        throw Failure("cannot move the write-ahead log into " + Visible(db) + "; try again when no program reads it");
    }
    WriteLine("moved the write-ahead log into " + Visible(db));
    return kDone;
}

}  // namespace

void AddDb(CLI::App& app, int& status) {
    CLI::App& db = *app.add_subcommand("db", "Create and look after log databases");
    db.require_subcommand(1);
    AddCommand<DbOptions>(db, "create", "Create an empty log database", status, setup, runCreate);
    AddCommand<DbOptions>(db, "info", "Size, rows and dates of a log database", status, setupInfo, runInfo);
    AddCommand<DbOptions>(db, "checkpoint", "Move the write-ahead log into the database", status, setup, runCheckpoint);
    AddSalvage(db, status);
    AddCare(db, status);
}

}  // namespace quor::cli
