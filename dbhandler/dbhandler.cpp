#include "dbhandler.h"

#include <unistd.h>

#include <utility>

#include "common.h"
#include "common/handles.h"
#include "dbhandler/readers.h"

DBHandler::DBHandler() = default;

DBHandler::DBHandler(std::string dbPath, std::string schemaPath)
    : schemaPath_(std::move(schemaPath)), dbPath_(std::move(dbPath)) {}

DBHandler::~DBHandler() = default;

int DBHandler::DBCon() {
    if (isConnected()) {
        Debuger::MSG(0, "Connection is already existed");
        return -1;
    }
    if (QLIBCFileExist(dbPath_.c_str()) == 0) {
        Debuger::MSG(2, "Database is not existed: " + dbPath_);
        if (DBCreate() != 0) {
            Debuger::MSG(0, "Fail to create database: " + dbPath_);
            return -1;
        }
    }
    connection_ = QUORDBConnect(nullptr, nullptr, nullptr, dbPath_.c_str());
    if (connection_ == nullptr) {
        Debuger::MSG(0, "Fail to open db: " + dbPath_);
        return -1;
    }
    return 0;
}

int DBHandler::DBDiscon() {
    if (isConnected()) {
        QUORDBClose(std::exchange(connection_, nullptr));
    }
    return 0;
}

bool DBHandler::isConnected() {
    return connection_ != nullptr;
}

int DBHandler::isInTran() {
    return inTran_;
}

int DBHandler::DBExecute(std::string sql) {
    if (!isConnected()) {
        return -1;
    }
    if (QUORDBExecute(connection_, sql.c_str(), nullptr) < 0) {
        DBErrorHandle(sql);
        return -1;
    }
    return 0;
}

int DBHandler::DBExecute(std::string sql, int (*callback)(DBResult_tag*, void*), void* context) {
    if (!isConnected()) {
        Debuger::MSG(0, "DB is not connected");
        return -1;
    }
    quor::Result result;
    if (QUORDBExecute(connection_, sql.c_str(), quor::Adopt(result)) < 0) {
        DBErrorHandle(sql);
        return -1;
    }
    if (callback != nullptr) {
        (void)callback(result.get(), context);  // the statement succeeded whatever its reader thinks of the rows
    }
    return 0;
}

// A transaction is open (1) or not (0) afterwards; it must be the other way round before.
int DBHandler::TranStatement(const char* operation, const char* statement, int32_t afterwards, const char* failure) {
    if (!isConnected() || inTran_ == afterwards) {
        Debuger::MSG(0, std::string("Fail to check sanity (") + operation + ")");
        return -1;
    }
    if (QUORDBExecute(connection_, statement, nullptr) < 0) {
        Debuger::MSG(0, failure);
        return -1;
    }
    inTran_ = afterwards;
    return 0;
}

int DBHandler::DBTranStart() {
    return TranStatement("DBTranStart", "BEGIN;", 1, "Fail to begin transaction");
}

int DBHandler::DBTranEnd() {
    return TranStatement("DBTranEnd", "END;", 0, "Fail to end transaction");
}

int DBHandler::DBTranRollback() {
    return TranStatement("DBTranRollback", "ROLLBACK;", 0, "Fail to rollback transaction");
}

std::string DBHandler::DBCmdEscape(std::string text) {
    const size_t size = 2 * text.size() + 1;
    const quor::CText buffer(static_cast<char*>(malloc(size)));
    if (buffer == nullptr) {
        Debuger::MSG(0, "Fail to allocate memory");
        return {};
    }
    if (QUORDBEscapeStringEX(connection_, buffer.get(), static_cast<unsigned int>(size), text.c_str(),
                             static_cast<unsigned int>(text.size())) < 0) {
        Debuger::MSG(0, "Fail to escapse string");
        return {};
    }
    return buffer.get();
}

int DBHandler::DBWalCheckpoint(bool removeFiles) {
    if (QUORDBExecute(connection_, "PRAGMA wal_checkpoint(FULL);", nullptr) < 0) {
        Debuger::MSG(0, "Fail to force WAL checkpoint(FULL)");
        return -1;
    }
    if (removeFiles) {
        for (const char* suffix : {"-wal", "-shm"}) {
            (void)unlink((dbPath_ + suffix).c_str());  // there may be none
        }
    }
    return 0;
}
