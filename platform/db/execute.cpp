// Running a statement and collecting its result.
#include <memory>
#include <new>

#include "base/guarded.h"
#include "platform/db/connection.h"
#include "platform/db/result.h"
#include "platform/db/statement.h"

namespace {

int runThrough(sqlite3_stmt* statement) {
    int status = SQLITE_ROW;
    while (status == SQLITE_ROW) {
        status = sqlite3_step(statement);
    }
    return status == SQLITE_DONE ? 0 : -1;
}

// SQLITE_DONE when every row is stored, SQLITE_FULL when there was no room, or SQLite's error.
int collect(sqlite3_stmt* statement, DBResult_tag& result) {
    int status = sqlite3_step(statement);
    result.setColumns(statement);  // the first step may compile the statement anew
    for (; status == SQLITE_ROW; status = sqlite3_step(statement)) {
        if (!result.append(statement)) {
            return SQLITE_FULL;
        }
    }
    return status == SQLITE_DONE && !result.finish() ? SQLITE_FULL : status;
}

int execute(sqlite3* db, quor::Statement statement, DBResult_tag** result) {
    if (statement == nullptr || result == nullptr) {
        return statement != nullptr ? runThrough(statement.get()) : -1;
    }
    auto collected = std::make_unique<DBResult_tag>();
    const int status = collect(statement.get(), *collected);
    statement.reset();  // it would hide an error of our own
    if (status == SQLITE_FULL && sqlite3_errcode(db) != SQLITE_FULL) {
        quor::SetError(db, SQLITE_FULL, "no room in the temporary folder for the result");
    }
    if (status != SQLITE_DONE) {
        return -1;
    }
    *result = collected.release();
    return 0;
}

// Runs what `prepare` gives; nothing is thrown to a C program.
template <typename Prepare>
int guarded(DBConnect_tag* connection, const char* sql, DBResult_tag** result, Prepare prepare) {
    if (result != nullptr) {
        *result = nullptr;
    }
    if (quor::AnyNull(connection, sql)) {
        return -1;
    }
    try {
        return execute(connection->db.get(), prepare(connection->db.get()), result);
    } catch (const std::bad_alloc&) {
        quor::SetError(connection->db.get(), SQLITE_NOMEM, "out of memory");
        return -1;
    }
}

}  // namespace

int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result) {
    return guarded(connection, sql, result, [sql](sqlite3* db) { return quor::PrepareOnly(db, sql); });
}

int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result) {
    return guarded(connection, sql, result,
                   [&](sqlite3* db) { return quor::PrepareOnly(db, quor::WithWindow(sql, count, skip).c_str()); });
}
