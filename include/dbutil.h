// Log query layer: the log record and its names, conditions, selection, counting and deletion, search conditions, name
// maps, and the readers of the accounting database. Conventions: see common.h. Failures are reported to the system log.
//
// A database path is valid when it is absolute. Every call opens its own connection and closes it before it returns.
#ifndef QUORSYSLOG_DBUTIL_H
#define QUORSYSLOG_DBUTIL_H

#include <cstdint>
#include <list>
#include <map>
#include <string>

struct DBResult_tag;

#pragma GCC visibility push(default)

// Attributes of a log. Two of them are columns named "ip": one of table logs, one of transfer_log.
enum _SYSLOG_DB_ATTRI_tag : int32_t {
    SYSLOG_ATTRI_ID = 0,
    SYSLOG_ATTRI_HOST = 1,
    SYSLOG_ATTRI_IP = 2,
    SYSLOG_ATTRI_FAC = 3,
    SYSLOG_ATTRI_PRIO = 4,
    SYSLOG_ATTRI_LLEVEL = 5,
    SYSLOG_ATTRI_TAG = 6,
    SYSLOG_ATTRI_UTCSEC = 7,
    SYSLOG_ATTRI_TZOFFSET = 8,
    SYSLOG_ATTRI_LDATE = 9,
    SYSLOG_ATTRI_LTIME = 10,
    SYSLOG_ATTRI_PROG = 11,
    SYSLOG_ATTRI_MSG = 12,
    SYSLOG_ATTRI_LUSER = 13,
    SYSLOG_ATTRI_EVENT = 14,
    SYSLOG_ATTRI_ISDIR = 15,
    SYSLOG_ATTRI_FNAME = 16,
    SYSLOG_ATTRI_FSIZE = 17,
    SYSLOG_ATTRI_XFERIP = 18,
    SYSLOG_ATTRI_NONE = 19,  // no attribute matched
};

// Severities in the standard order; the smaller, the more severe.
enum _SYSLOG_DB_PRIORITY_tag : int32_t {
    SYSLOG_PRIORITY_EMERG = 0,
    SYSLOG_PRIORITY_ALERT = 1,
    SYSLOG_PRIORITY_CRIT = 2,
    SYSLOG_PRIORITY_ERR = 3,
    SYSLOG_PRIORITY_WARNING = 4,
    SYSLOG_PRIORITY_NOTICE = 5,
    SYSLOG_PRIORITY_INFO = 6,
    SYSLOG_PRIORITY_DEBUG = 7,
};

// Names of the severities, by value.
extern const char* const g_MappingSyslogPrior[8];

// Operators of a condition.
enum _SYSLOG_SQL_OP_tag : int {
    SYSLOG_OP_EQUAL = 0,
    SYSLOG_OP_NOT_EQUAL = 1,
    SYSLOG_OP_BELOW = 2,
    SYSLOG_OP_AT_MOST = 3,
    SYSLOG_OP_ABOVE = 4,
    SYSLOG_OP_AT_LEAST = 5,
    SYSLOG_OP_LIKE = 6,
    SYSLOG_OP_NOT_LIKE = 7,
    SYSLOG_OP_GLOB = 8,
    SYSLOG_OP_NOT_GLOB = 9,
};

// Their SQL, by value.
extern const char* const g_MappingSyslogOP[10];

// One log, of any table. Each converter fills the fields of its table and leaves the others alone.
struct _SYSLOG_LOG_DATA_tag {
    unsigned long long id = 0;
    long long utcsec = 0;  // Unix seconds of the message
    long long xsec = 0;    // the second time of a text entry; never in a table
    _SYSLOG_DB_PRIORITY_tag prio = SYSLOG_PRIORITY_EMERG;
    std::string tag;
    std::string host;
    std::string ip;
    std::string fac;
    std::string tzoffset;
    std::string ldate;  // local date, "YYYY-MM-DD"
    std::string ltime;  // local time
    std::string prog;
    std::string msg;
    std::string luser;
    std::string event;  // the message of general_log and connection_log, the event of transfer_log
    std::string xferip;
    std::string fname;
    unsigned long long isdir = 0;
    std::string fsize;
};

// One condition: attribute, operator (SYSLOG_OP_..., an index into g_MappingSyslogOP), value as the user gave it, and
// alternatives that are joined with OR. The alternatives of an alternative are ignored.
struct _SYSLOG_SQL_COND_tag {
    _SYSLOG_DB_ATTRI_tag attr = SYSLOG_ATTRI_ID;
    int op = SYSLOG_OP_EQUAL;
    std::string value;
    std::list<_SYSLOG_SQL_COND_tag> orList;
};

// A window of rows. Filtered selections use the low 32 bits of both numbers.
struct _SYSLOG_SQL_LIMIT_tag {
    unsigned long long limit = 0;   // rows wanted; 0 means all
    unsigned long long offset = 0;  // rows skipped
};

struct _SYSLOG_SQL_ORDER_tag {
    int32_t asc = 0;  // 0: descending
    _SYSLOG_DB_ATTRI_tag attr = SYSLOG_ATTRI_ID;
};

// One EPS sample: the logs counted between two closings (not a rate per second).
struct SYSLOG_LOG_EPS {
    long long stamp = 0;                     // Unix seconds of the closing
    unsigned long long eps = 0;              // logs in the sample
    std::map<std::string, int32_t> devices;  // logs by device
};

enum _SYSLOG_EXTKEY_TB_TYPE_tag : int32_t {
    SYSLOG_EXTKEY_HOST = 0,
    SYSLOG_EXTKEY_PROG = 1,
    SYSLOG_EXTKEY_TAG = 2,
    SYSLOG_EXTKEY_FAC = 3,
};

// Describes one key table of a version 1 database.
struct _SYSLOG_EXTKEY_TB_INFO_tag {
    _SYSLOG_EXTKEY_TB_TYPE_tag type;
    std::string tableName;
    std::string idColumn;
    std::string nameColumn;
};

// ---- names

// Column name of an attribute; the empty text outside 0 to 18.
const char* LogAttriStrGet(_SYSLOG_DB_ATTRI_tag attr);
// First attribute of that name, or SYSLOG_ATTRI_NONE. "ip" is always SYSLOG_ATTRI_IP.
_SYSLOG_DB_ATTRI_tag LogAttriType(std::string name);
// Severity of that name; debug when null or unknown.
_SYSLOG_DB_PRIORITY_tag PriorStrToType(const char* name);
// Name of a severity; the empty text outside 0 to 7.
std::string PriorTypeToStr(_SYSLOG_DB_PRIORITY_tag prio);
// The text after the first ":", or the whole text. A blank after the colon stays.
std::string TrimUserName(const std::string& text);

// ---- rows to records: -1 when `result` or `rec` is null

// By table name ("logs", "general_log", "connection_log", "transfer_log"); -1 for any other. `trim` cuts the user name
// off the message (TrimUserName), in table logs only.
int DBRecToLogInfo(std::string& table, DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec, bool trim);
int DBRecToAllLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec, bool trim);
int DBRecToSysLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec);
int DBRecToXferLogInfo(DBResult_tag* result, unsigned int row, _SYSLOG_LOG_DATA_tag* rec);

// ---- conditions to SQL

// The value escaped for its operator. LIKE and GLOB take "*" and "?" as wildcards and everything else literally. The
// empty text for a null condition, and for a value that cannot be escaped.
std::string CondValueEscape(const _SYSLOG_SQL_COND_tag* cond);
// Replaces `out` with the condition as SQL. The value of a numeric attribute (id, utcsec) is neither quoted nor
// checked: it must be a number. Always 0.
int SqlCondToStr(const _SYSLOG_SQL_COND_tag& cond, std::string& out);
// Appends the conditions joined by " AND " to `out`, without "WHERE".
int SqlCondListToStr(std::list<_SYSLOG_SQL_COND_tag>& conds, std::string& out);

// Fills `cond` with "attr equals one of the comma-separated values", which are not trimmed. An empty text or "any"
// leaves `cond` alone. Always 0.
int OneCondListGen(_SYSLOG_DB_ATTRI_tag attr, const std::string& text, _SYSLOG_SQL_COND_tag& cond);
// Appends the conditions of a search form. The first four are comma-separated lists; an empty one or "any" asks for
// nothing. `keyword` is a GLOB pattern that the caller wraps in "*" ("**" matches every log). A date that is empty or
// "0" is not set; dates compare as text.
void LogSearchCondListGen(std::string& hosts, std::string& levels, std::string& facs, std::string& progs,
                          std::string& keyword, std::string& fromDate, std::string& toDate,
                          std::list<_SYSLOG_SQL_COND_tag>& conds);

// ---- selection, counting, deletion: the table name is used as given, unchecked; `limit` and `order` may be null

// Hands each row to `callback` until it returns nonzero, which is no failure; a null callback walks over the rows. The
// same record is used for every row. Without a filter the window is counted back from the largest id, so it holds the
// newest rows whatever the order, and deleted ids shrink it.
int SyslogDBSelectByTable(std::string& dbPath, std::string& table, std::list<_SYSLOG_SQL_COND_tag>& conds,
                          _SYSLOG_SQL_LIMIT_tag* limit, _SYSLOG_SQL_ORDER_tag* order,
                          int (*callback)(_SYSLOG_LOG_DATA_tag&, void*), void* ctx, bool trim);
// The same on table logs.
int SyslogDBSelect(std::string& dbPath, std::list<_SYSLOG_SQL_COND_tag>& conds, _SYSLOG_SQL_LIMIT_tag* limit,
                   _SYSLOG_SQL_ORDER_tag* order, int (*callback)(_SYSLOG_LOG_DATA_tag&, void*), void* ctx, bool trim);
// Number of matching rows (low 32 bits); -1 on failure, -2 when the result is more than one row. Without a filter it is
// the largest id, not a count.
int SyslogDBSelectCountByTable(std::string& dbPath, std::string& table, std::list<_SYSLOG_SQL_COND_tag>& conds,
                               _SYSLOG_SQL_LIMIT_tag* limit, _SYSLOG_SQL_ORDER_tag* order);
// The same on table logs.
int SyslogDBSelectCount(std::string& dbPath, std::list<_SYSLOG_SQL_COND_tag>& conds, _SYSLOG_SQL_LIMIT_tag* limit,
                        _SYSLOG_SQL_ORDER_tag* order);
// Deletes the matching rows of table logs: all of them when there is no condition.
int SyslogDBDelete(std::string& dbPath, std::list<_SYSLOG_SQL_COND_tag>& conds);

// ---- names in a log database

// Replaces `map` with keys and names. In a version 2 database (see SyslogDBVersionGet) the keys number the distinct
// values from 0. -1 leaves the map as it was, or with the rows before one that could not be read.
int SyslogDBExtkeyMapGet(std::string& dbPath, _SYSLOG_EXTKEY_TB_TYPE_tag type,
                         std::map<unsigned long long, std::string>& map);
// Key of `name`, or 0 when there is none or the names cannot be read; 0 is also the first key of a version 2 database.
unsigned long long SyslogDBExtkeyLookupByName(std::string& dbPath, _SYSLOG_EXTKEY_TB_TYPE_tag type, std::string name);
// Appends the distinct values of an attribute of table logs in ascending order. `limit` may be null. -1 for a name that
// is no attribute, too.
int SyslogDBAttriValueGet(std::string& dbPath, std::string& attrName, _SYSLOG_SQL_LIMIT_tag* limit,
                          std::list<std::string>& values);

// ---- statistics of an accounting database

// 2 when the database has no readable table db_info, 1 in every other case (failures included).
uint32_t SyslogDBVersionGet(std::string& path);
// Sum of all counts; 0 on failure.
unsigned long long SyslogDBHistTotalGet(std::string& path);
// Count of one device; 0 when absent or on failure. The device is not escaped.
unsigned long long SyslogDBHistGetSingle(std::string& path, std::string device);
// Counts by device: all (limit 0) or the largest `limit`, in the order of the names. Empty on failure.
std::map<std::string, unsigned long long> SyslogDBHistGet(std::string& path, int limit);
// Samples with from <= stamp <= to, by stamp. Empty on failure.
std::map<int32_t, SYSLOG_LOG_EPS> SyslogDBEpsGet(std::string& path, int from, int to);

#pragma GCC visibility pop

#endif
