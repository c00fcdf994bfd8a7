/* Database wrapper: SQLite behind connection and result handles.
 *
 * An int result is negative on failure. A null or nonsensical argument fails; it never crashes. Nothing is written to
 * the system log: the caller reports. A connection and its results belong to one thread at a time. */
#ifndef QUOR_QUORDB_H
#define QUOR_QUORDB_H

#ifdef __cplusplus
extern "C" {
#endif

#pragma GCC visibility push(default)

typedef struct DBConnect_tag DBConnect_tag; /* an open connection */
typedef struct DBResult_tag DBResult_tag;   /* the result of one statement, complete in itself */

/* Opens the database file `path`, which must exist; the first three arguments are not used. The file is not read yet,
 * so a damaged one may still connect. Null on failure. Close with QUORDBClose(). */
DBConnect_tag* QUORDBConnect(const char* host, const char* user, const char* password, const char* path);

/* Closes the connection; null is ignored. Results stay usable. */
void QUORDBClose(DBConnect_tag* connection);

/* Runs exactly one statement. Text after it other than blanks, comments and semicolons is refused before anything runs,
 * and so is an empty statement. Waits a few seconds for another process's lock. With a result pointer the whole result
 * is stored there, to be released with QUORDBFreeResult(); on failure it becomes null. */
int QUORDBExecute(DBConnect_tag* connection, const char* sql, DBResult_tag** result);

/* The same for a SELECT without a LIMIT of its own, restricted to `count` rows (0: no limit) after the first `skip`. */
int QUORDBSelectLimit(DBConnect_tag* connection, const char* sql, unsigned int count, unsigned int skip,
                      DBResult_tag** result);

/* Hands out the next row number, from 0 on; negative when no row is left. */
int QUORDBFetchRow(DBResult_tag* result, unsigned int* row);

/* Text of a field; null for NULL, an unknown column or row. It belongs to the result and lives until
 * QUORDBFreeResult(). A value with a zero byte ends there for a reader of C strings. */
const char* QUORDBFetchField(DBResult_tag* result, unsigned int row, const char* column);

/* Number of rows; 0 for null. */
int QUORDBNumRows(DBResult_tag* result);

/* Releases the result; null is ignored. */
void QUORDBFreeResult(DBResult_tag* result);

/* Text of the last error. It belongs to the connection and lives until its next use. Never null. */
const char* QUORDBErrorGet(DBConnect_tag* connection);

/* The underlying sqlite3*; null for null. */
void* QUORDBInternalDBHdlGet(DBConnect_tag* connection);

/* Write `in` with every single quote doubled, for a single-quoted SQL literal, and a terminating zero byte. Twice the
 * length plus one always suffices. The connection is not used and may be null. */
int QUORDBEscapeStringEX(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in,
                         unsigned int inLen);
int QUORDBEscapeStringEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in,
                          unsigned int inLen);

/* Writes the C string `in` with a backslash before every backslash, percent sign and underscore, for a LIKE pattern
 * with ESCAPE '\'. */
int QUORDBEscapeBackslashEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in);

#pragma GCC visibility pop

#ifdef __cplusplus
}
#endif

#endif
