// Database access: the handle on one SQLite database, its metadata, error handling, and the control of syslog-ng's
// working database. Conventions: see common.h. Failures of the handle are reported through Debuger::MSG.
#ifndef QUORSYSLOG_DBHANDLER_H
#define QUORSYSLOG_DBHANDLER_H

#include <cstdint>
#include <string>

struct DBConnect_tag;
struct DBResult_tag;

#pragma GCC visibility push(default)

// Metadata of one log database: the row of table db_info.
struct _ARCH_DB_INFO_tag {
    long long start_time = 0;          // Unix seconds of the oldest log
    long long end_time = 0;            // Unix seconds of the newest log
    unsigned long long log_count = 0;  // number of logs
    std::string device;                // the device the database belongs to
};

// A handle on one database file.
//
// The destructor does not close the connection: call DBDiscon() before the handle goes away.
class DBHandler {
  public:
    // Called once with the whole result; walks the rows itself. Its return value is ignored.
    using ResultCallback = int (*)(DBResult_tag* result, void* context);

    DBHandler();
    // `schemaPath` names the SQL file from which DBCon() creates the database when the file is missing.
    DBHandler(std::string dbPath, std::string schemaPath);
    DBHandler(const DBHandler&) = delete;
    DBHandler& operator=(const DBHandler&) = delete;
    ~DBHandler();

    // Connects, creating a missing database first. -1 when already connected or when either step fails.
    int DBCon();
    // Closes the connection if there is one. Always 0. The transaction flag stays as it is.
    int DBDiscon();
    bool isConnected();
    // 1 between a successful DBTranStart() and DBTranEnd() or DBTranRollback(), else 0.
    int isInTran();

    // Runs one statement. A failed statement goes through DBErrorHandle(). Without a connection: -1, no message.
    int DBExecute(std::string sql);
    // The same, handing the result to `callback` (may be null). Without a connection it reports that.
    int DBExecute(std::string sql, int (*callback)(DBResult_tag*, void*), void* context);

    // Each fails without a connection or when the flag is not as needed. A failed statement leaves the flag unchanged.
    int DBTranStart();
    int DBTranEnd();
    int DBTranRollback();

    // `text` escaped for a single-quoted SQL literal; empty on failure.
    std::string DBCmdEscape(std::string text);
    // 1 when the table exists; 0 when it does not or the query failed. The name is not escaped.
    int DBcheckTableExist(std::string table);
    // Rows of table logs; all bits set on failure. Counts above 2147483647 read as 2147483647.
    unsigned long long DBLogCountGet();
    // The same as DBLogCountGet().
    unsigned long long DBInfoCntGet();
    // Moves the write-ahead log into the database. With `removeFiles` the "-wal" and "-shm" files are then unlinked:
    // only for a database that no other connection uses.
    int DBWalCheckpoint(bool removeFiles);

    // Classifies the last error of the connection, writes the failure of `sql` to the system log, and has a corrupt
    // database file moved aside (DBErrorHandle_SQLITE_CORRUPT).
    void DBErrorHandle(std::string sql);

    // Creates the folder and the database from the schema file, in write-ahead journaling mode. 0 says that the
    // database shell could be run, not that the schema was without errors.
    int DBCreate();
    // Fills `info` from db_info; untouched on failure.
    int DBInfoGet(_ARCH_DB_INFO_tag& info);
    // Unix seconds of the oldest and newest row of table logs, 0 when unknown. The DBInfo forms read logs too, not
    // db_info.
    long long DBLogStartTimeGet();
    long long DBLogEndTimeGet();
    long long DBInfoStartGet();
    long long DBInfoEndGet();
    // The same as local dates "YYYY-MM-DD". An unknown time gives the date of time 0.
    std::string DBInfoStartStrGet();
    std::string DBInfoEndStrGet();
    // Update the db_info row. The device is not escaped: see DBCmdEscape().
    int DBInfoStartSet(unsigned long long time);
    int DBInfoEndSet(unsigned long long time);
    int DBInfoDevSet(std::string device);

  private:
    int TranStatement(const char* operation, const char* statement, int32_t afterwards, const char* failure);
    long long LogTimeGet(const char* direction);
    int UpdateInfo(const std::string& column, const std::string& value);

    std::string schemaPath_;
    std::string dbPath_;
    DBConnect_tag* connection_ = nullptr;
    int32_t inTran_ = 0;
};

// Moves a corrupt database to `dbPath` + ".corrupt", sends the notification "QUORSYSLOG_DB_CORRUPT" and makes syslog-ng
// reopen its files. The notification goes out even when the file cannot be moved. `connection` is not used.
int DBErrorHandle_SQLITE_CORRUPT(DBConnect_tag* connection, std::string dbPath);

// Tells the syslog-ng that is in charge (the package's own job when the package is enabled, else the system's service)
// to reopen its files.
int SyslogngHupSignalSend();

// Removes the working database when its size in whole KiB is above `maxSizeKB`, and has syslog-ng create a new one.
// 0 also when the file was small enough. -1 without a message when there is no such file.
int SyslogngWorkingDbCheck(std::string dbPath, int maxSizeKB);

// Switches the working database to write-ahead journaling with the database shell. The path is not quoted: it must hold
// no blank and nothing that means something to a shell. 0 says only that the shell could be run.
int SyslogngWorkingDbSetJouWal(std::string dbPath);

#pragma GCC visibility pop

#endif
