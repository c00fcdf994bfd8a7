// db create, info, checkpoint.
#include <sys/stat.h>
#include <unistd.h>

#include "base/paths.h"
#include "dbhandler.h"
#include "dbhandler/session.h"
#include "store/ask.h"
#include "store/databasefile.h"
#include "store/selection.h"
#include "tools/quorlog/commands/commands.h"
#include "tools/quorlog/messages.h"
#include "tools/quorlog/options.h"
#include "tools/quorlog/shellpath.h"

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

void connect(DbSession& session, const std::string& path) {
    if (!session.connect()) {
        throw Failure("cannot open " + path + "; make sure that you may read and write it and its folder",
                      store::Cause::Denied);
    }
}

int runCreate(const DbOptions& options) {
    const std::string db = store::AbsolutePath(options.db);
    RequirePlainPath(db, Quoting::Double);
    struct stat status = {};
    if (lstat(db.c_str(), &status) == 0) {
        throw Failure(db + " exists already; move it away or give another --db");
    }
    if (access(paths::kLogSchema, R_OK) != 0 || access(paths::kSqliteShell, X_OK) != 0) {
        throw Failure(std::string("needs ") + paths::kLogSchema + " and " + paths::kSqliteShell + "; install them",
                      store::Cause::Missing);
    }
    DbSession session(db, paths::kLogSchema);
    connect(session, db);
    if (session->DBcheckTableExist("logs") != 1) {
        throw Failure("could not create the tables of " + db + "; see the system log", store::Cause::Other);
    }
    WriteLine("created " + db);
    return kDone;
}

// The largest tables and indexes; nothing where SQLite cannot tell.
std::string largestParts(const std::string& db) try {
    std::string list;
    for (const std::string& part :
         store::Ask(db,
                    "SELECT name || ' ' || pgsize AS part FROM dbstat WHERE aggregate = TRUE ORDER BY pgsize DESC "
                    "LIMIT 3",
                    "part")) {
        list += (list.empty() ? "" : ", ") + part;
    }
    return list;
} catch (const Failure& failure) {
    if (failure.cause() != store::Cause::Missing) {
        throw;
    }
    return "";
}

int runInfo(const DbOptions& options) {
    const auto source = store::OpenSource(options.db);
    const std::string& db = source->name();
    const uint64_t rows = store::Count(*source, {});
    DbSession handle(db, paths::kLogSchema);
    connect(handle, db);
    _ARCH_DB_INFO_tag info;
    const bool described = handle->DBcheckTableExist("db_info") == 1 && handle->DBInfoGet(info) == 0;
    Output out(STDOUT_FILENO);
    WriteRecord(options.output.style(),
                {{"path", db},
                 {"bytes", std::to_string(store::SizeOf(db)), Kind::Number},
                 {"wal_bytes", std::to_string(store::SizeOf(db + "-wal")), Kind::Number},
                 {"free_bytes", std::to_string(store::FreeBytes(db)), Kind::Number},
                 {"largest", largestParts(db)},
                 {"device", described ? info.device : ""},
                 {"logs", std::to_string(rows), Kind::Number},
                 {"oldest", rows == 0 ? "" : handle->DBInfoStartStrGet()},
                 {"newest", rows == 0 ? "" : handle->DBInfoEndStrGet()}},
                out);
    return kDone;
}

int runCheckpoint(const DbOptions& options) {
    const std::string db = store::RequireLogDatabase(options.db);
    DbSession session(db, paths::kLogSchema);
    connect(session, db);
    if (session->DBWalCheckpoint(false) != 0) {
        (void)store::Ask(db, "SELECT 1 FROM sqlite_schema LIMIT 1", "1");
        throw Failure("cannot move the write-ahead log into " + db + "; try again when no other program is reading it",
                      store::Cause::Busy);
    }
    WriteLine("moved the write-ahead log into " + db);
    return kDone;
}

}  // namespace

void AddDb(CLI::App& app, int& status) {
    CLI::App& db = *app.add_subcommand("db", "Create and look after log databases");
    db.require_subcommand(1);
    AddCommand<DbOptions>(db, "create", "Create an empty log database", status, setup, runCreate);
    AddCommand<DbOptions>(db, "info", "Print the size, rows and dates of a log database", status, setupInfo, runInfo);
    AddCommand<DbOptions>(db, "checkpoint", "Move the write-ahead log into the database", status, setup, runCheckpoint);
    AddDbSalvage(db, status);
    AddDbMerge(db, status);
    AddDbCompact(db, status);
    AddDbCheck(db, status);
}

}  // namespace quor::cli
