#include <syslog.h>

#include "common.h"
#include "common/localtime.h"
#include "dbhandler.h"
#include "dbhandler/readers.h"
#include "dbhandler/shell.h"
#include "quor/quorfs.h"

namespace {

std::string dateOrReport(long long seconds, const char* unknown) {
    if (seconds == 0) {
        Debuger::MSG(0, unknown);
    }
    return quor::LocalTimeText(seconds, "%Y-%m-%d");
}

}  // namespace

int DBHandler::DBCreate() {
    const std::string folder = dbPath_.substr(0, dbPath_.rfind('/'));
    if (QUORFSMkdirP(folder.c_str(), 0, 1, -1, -1, 0777) < 0) {
        Debuger::MSG(0, "Fail to create folder: " + folder);
        return -1;
    }
    const std::string quotedPath = "\"" + dbPath_ + "\"";
    if (!quor::RunShell(quor::paths::kSqliteShell + (" " + quotedPath) + " < " + schemaPath_)) {
        Debuger::MSG(0, "Fail to create database: " + dbPath_ + "," + schemaPath_);
        return -1;
    }
    syslog(LOG_INFO, "create database: %s by %s", dbPath_.c_str(), schemaPath_.c_str());
    const std::string command = quor::WalCommand(quotedPath);
    if (!quor::RunShell(command)) {
        Debuger::MSG(0, "Fail to set jounal mode as WAL, use DELETE by default " + command);
    }
    return 0;
}

int DBHandler::DBInfoGet(_ARCH_DB_INFO_tag& info) {
    const std::string sql = "SELECT * FROM db_info";
    _ARCH_DB_INFO_tag read;
    if (DBExecute(sql, quor::ReadInfo, &read) != 0) {
        Debuger::MSG(0, "Fail to execute SQL command: " + sql);
        return -1;
    }
    info = read;
    return 0;
}

unsigned long long DBHandler::DBLogCountGet() {
    _ARCH_DB_INFO_tag info;
    if (DBExecute("SELECT COUNT(*) as count_result FROM logs", quor::ReadCount, &info) != 0) {
        return static_cast<unsigned long long>(-1);
    }
    return info.log_count;
}

unsigned long long DBHandler::DBInfoCntGet() {
    return DBLogCountGet();
}

long long DBHandler::LogTimeGet(const char* direction) {
    const std::string sql = std::string("SELECT * FROM logs ORDER BY utcsec ") + direction + " LIMIT 1";
    _ARCH_DB_INFO_tag info;
    if (DBExecute(sql, quor::ReadTime, &info) != 0) {
        if (DBcheckTableExist("logs") != 0) {
            Debuger::MSG(0, "Fail to execute SQL command: " + sql);
        }
        return 0;
    }
    return info.start_time;
}

long long DBHandler::DBLogStartTimeGet() {
    return LogTimeGet("ASC");
}

long long DBHandler::DBLogEndTimeGet() {
    return LogTimeGet("DESC");
}

long long DBHandler::DBInfoStartGet() {
    return DBLogStartTimeGet();
}

long long DBHandler::DBInfoEndGet() {
    return DBLogEndTimeGet();
}

std::string DBHandler::DBInfoStartStrGet() {
    return dateOrReport(DBLogStartTimeGet(), "Fail to get database start time");
}

std::string DBHandler::DBInfoEndStrGet() {
    return dateOrReport(DBLogEndTimeGet(), "Fail to get database end time");
}

int DBHandler::UpdateInfo(const std::string& column, const std::string& value) {
    const std::string sql = "UPDATE db_info SET " + column + "='" + value + "' WHERE id=1";
    if (DBExecute(sql) != 0) {
        Debuger::MSG(0, "Fail to execute SQL command: " + sql);
        return -1;
    }
    return 0;
}

int DBHandler::DBInfoStartSet(unsigned long long time) {
    return UpdateInfo("start_time", ullNumberToString(time));
}

int DBHandler::DBInfoEndSet(unsigned long long time) {
    return UpdateInfo("end_time", ullNumberToString(time));
}

int DBHandler::DBInfoDevSet(std::string device) {
    return UpdateInfo("device", device);
}
