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

    DBHandler();  // both paths are empty
    // `schemaPath` names the SQL file from which DBCon() creates the database when the file is missing.
    DBHandler(std::string dbPath, std::string schemaPath);
    DBHandler(const DBHandler&) = delete;
    DBHandler& operator=(const DBHandler&) = delete;
    ~DBHandler();

    // Connects, after creating a missing database from its schema. -1 when already connected or when either step fails.
    int DBCon();
    // Closes the connection if there is one. Always 0. The transaction flag stays as it is (see isInTran()).
    int DBDiscon();
    bool isConnected();
    // 1 between a successful DBTranStart() and DBTranEnd() or DBTranRollback(), else 0.
    int isInTran();

    // Runs one statement. A failed one goes through DBErrorHandle(). Without a connection: -1 and no message.
    int DBExecute(std::string sql);
    // The same, handing the result to `callback` (may be null). A missing connection is reported.
    int DBExecute(std::string sql, int (*callback)(DBResult_tag*, void*), void* context);

    // Begin, commit and roll back. Each fails without a connection; the first also inside a transaction, the others
    // outside one. A failed statement is reported, not passed to DBErrorHandle(), and leaves the flag unchanged.
    int DBTranStart();
    int DBTranEnd();
    int DBTranRollback();

    // `text` escaped for a single-quoted SQL literal; the empty text on failure.
    std::string DBCmdEscape(std::string text);
    // 1 when the table exists; 0 when it does not or the query failed. The name is not escaped.
    int DBcheckTableExist(std::string table);
    // Number of rows of table logs; all bits set on failure. Counts above 2147483647 read as 2147483647.
    unsigned long long DBLogCountGet();
    // The same.
    unsigned long long DBInfoCntGet();
    // Moves the write-ahead log into the database. With `removeFiles` the "-wal" and "-shm" files are unlinked after
    // that, which is safe only when no other connection uses the database.
    int DBWalCheckpoint(bool removeFiles);

    // Classifies the last error of the connection, writes the failure of `sql` to the system log, and has a corrupt
    // database file moved aside (DBErrorHandle_SQLITE_CORRUPT).
    void DBErrorHandle(std::string sql);

    // Creates the folder and the database from the schema file, in write-ahead journaling mode. 0 says that the
    // database shell could be run, not that the schema was without errors.
    int DBCreate();
    // Fills `info` from db_info, with times saturated to 32 bits. On failure `info` is left alone.
    int DBInfoGet(_ARCH_DB_INFO_tag& info);
    // Unix seconds of the oldest and newest row of table logs, saturated to 32 bits; 0 when unknown. The DBInfo forms
    // read table logs too, not db_info.
    long long DBLogStartTimeGet();
    long long DBLogEndTimeGet();
    long long DBInfoStartGet();
    long long DBInfoEndGet();
    // The same as local dates "YYYY-MM-DD". An unknown time is reported and gives the date of time 0.
    std::string DBInfoStartStrGet();
    std::string DBInfoEndStrGet();
    // Update the row of db_info. The device is not escaped: see DBCmdEscape().
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

// Sends the notification "QUORSYSLOG_DB_CORRUPT", moves the database to `dbPath` + ".corrupt" (replacing an earlier
// one) and makes syslog-ng reopen its files. A notification that cannot be sent does not keep the file from being
// moved. -1 when the file cannot be moved or syslog-ng cannot be told. `connection` is not used.
int DBErrorHandle_SQLITE_CORRUPT(DBConnect_tag* connection, std::string dbPath);

// Tells the syslog-ng that is in charge to reopen its files: the package's own job when the package is enabled, else
// the system's service. A failure is reported to the system log.
int SyslogngHupSignalSend();

// Removes the working database when its size in whole KiB is above `maxSizeKB`, and has syslog-ng create a new one.
// 0 also when the file was small enough. -1 when there is no such file, or (with a line in the system log) when it is
// not a regular file.
int SyslogngWorkingDbCheck(std::string dbPath, int maxSizeKB);

// Switches the working database to write-ahead journaling with the database shell. The path is not quoted: it must hold
// no blank and nothing that a shell interprets. 0 says only that the shell could be run.
int SyslogngWorkingDbSetJouWal(std::string dbPath);

#pragma GCC visibility pop

#endif
