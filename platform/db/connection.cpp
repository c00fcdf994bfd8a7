// Opening and closing a database file, and its errors.
#include "platform/db/connection.h"

#include <sys/stat.h>

#include <memory>
#include <string>

#include "base/guarded.h"
#include "platform/archive/table.h"
#include "platform/db/quiet.h"

namespace {

// How long a lock of another process is waited for: longer than any batch of the log writer takes.
constexpr int kBusyMilliseconds = 3000;

// Pages of the write-ahead log from which on a commit of ours moves them into the database. The log writer does that
// from 1,000 pages on; as long as it runs, nobody else starts it, since SQLite before 3.51.3 can damage a file when two
// connections restart the log at the same moment.
constexpr int kCheckpointPages = 10000;

bool isFile(const char* path) {
    struct stat status {};
    return stat(path, &status) == 0 && S_ISREG(status.st_mode);
}

// A file that cannot be written is opened for reading. One thread at a time uses a connection.
DBConnect_tag* connect(const char* path) {
    auto connection = std::make_unique<DBConnect_tag>();
    connection->quiet = quor::HoldQuiet(path);
    const bool quiet = static_cast<bool>(connection->quiet);
    const std::string name = quiet ? quor::QuietName(path) : quor::PlainName(path);
    const int mode = quiet ? SQLITE_OPEN_READONLY | SQLITE_OPEN_URI : SQLITE_OPEN_READWRITE;
    if (sqlite3_open_v2(name.c_str(), quor::Adopt(connection->db), mode | SQLITE_OPEN_NOMUTEX, nullptr) != SQLITE_OK) {
        return nullptr;
    }
    sqlite3_busy_timeout(connection->db.get(), kBusyMilliseconds);
    sqlite3_wal_autocheckpoint(connection->db.get(), kCheckpointPages);
    if (quor::archive::IsArchive(connection->db.get())) {
        (void)quor::archive::Register(connection->db.get());  // if that fails, so does every statement
    }
    return connection.release();
}

}  // namespace

std::string quor::PlainName(const char* path) {
    return path[0] == '/' ? path : std::string("./") + path;
}

DBConnect_tag* QUORDBConnect(const char* /*host*/, const char* /*user*/, const char* /*password*/, const char* path) {
    if (path == nullptr || !isFile(path)) {
        return nullptr;
    }
    return quor::Guarded<DBConnect_tag*>(nullptr, [path] { return connect(path); });
}

void QUORDBClose(DBConnect_tag* connection) {
    delete connection;
}

const char* QUORDBErrorGet(DBConnect_tag* connection) {
    return connection != nullptr ? sqlite3_errmsg(connection->db.get()) : "no database connection";
}

void* QUORDBInternalDBHdlGet(DBConnect_tag* connection) {
    return connection != nullptr ? connection->db.get() : nullptr;
}
