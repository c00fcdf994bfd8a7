#include "store/ask.h"

#include <unistd.h>

#include "common/errorcode.h"
#include "store/failure.h"

namespace quor::store {
namespace {

// A statement of ours is wrong only for a database that lacks what it names.
Cause causeOf(int code) {
    switch (code) {
    case SQLITE_ERROR:
        return Cause::Missing;
    case SQLITE_BUSY:
    case SQLITE_LOCKED:
        return Cause::Busy;
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
        return Cause::Damaged;
    case SQLITE_PERM:
    case SQLITE_AUTH:
    case SQLITE_READONLY:
    case SQLITE_CANTOPEN:
        return Cause::Denied;
    default:
        return Cause::Other;
    }
}

const char* adviceFor(Cause cause, int code) {
    switch (cause) {
    case Cause::Missing:
        return "choose another --table or --db; table logs comes with the first message";
    case Cause::Damaged:
        return "run quorlog db check on it";
    case Cause::Busy:
        return "another program is using it; try again";
    case Cause::Denied:
        return "make sure that you may read and write it and its folder";
    default:
        return code == SQLITE_FULL    ? "make room on its disk, and try again"
               : code == SQLITE_IOERR ? "check its disk; quorlog archive extract saves the sound rows of an archive"
                                      : "see the system log";
    }
}

}  // namespace

Connection Connect(const std::string& db) {
    Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, db.c_str()));
    if (connection == nullptr) {
        const bool missing = access(db.c_str(), F_OK) != 0;
        throw Failure("cannot open " + db + "; make sure that it is a database and that you may read it",
                      missing ? Cause::Missing : Cause::Denied);
    }
    return connection;
}

Result Execute(const Connection& connection, const std::string& db, const std::string& sql,
               const _SYSLOG_SQL_LIMIT_tag* limit) {
    Result result;
    const int status = limit == nullptr
                           ? QUORDBExecute(connection.get(), sql.c_str(), Adopt(result))
                           : QUORDBSelectLimit(connection.get(), sql.c_str(), static_cast<uint32_t>(limit->limit),
                                               static_cast<uint32_t>(limit->offset), Adopt(result));
    if (status < 0) {
        const int code = ErrorCode(connection.get());
        const Cause cause = causeOf(code);
        throw Failure(db + ": " + QUORDBErrorGet(connection.get()) + "; " + adviceFor(cause, code), cause);
    }
    return result;
}

std::vector<std::string> Ask(const std::string& db, const std::string& sql, const char* column) {
    const Connection connection = Connect(db);
    const Result result = Execute(connection, db, sql);
    std::vector<std::string> texts;
    for (Row row(result.get()); row.next();) {
        texts.emplace_back(row[column]);
    }
    return texts;
}

std::string Literal(const std::string& text) {
    const _SYSLOG_SQL_COND_tag value{SYSLOG_ATTRI_HOST, SYSLOG_OP_EQUAL, text, {}};
    return "'" + CondValueEscape(&value) + "'";
}

void RequireTable(const std::string& db, const std::string& table) {
    (void)Ask(db, "SELECT 1 FROM " + table + " LIMIT 1", "1");
}

}  // namespace quor::store
