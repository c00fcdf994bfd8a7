// Result callbacks of the handle. The context is an _ARCH_DB_INFO_tag; it stays untouched, and the result is -1, when
// there is no row.
#ifndef DBHANDLER_READERS_H
#define DBHANDLER_READERS_H

struct DBResult_tag;

namespace quor {

int ReadTime(DBResult_tag* result, void* info);   // "utcsec" into start_time, saturated to 32 bits
int ReadCount(DBResult_tag* result, void* info);  // "count_result" into log_count, saturated to 32 bits
int ReadInfo(DBResult_tag* result, void* info);   // the row of db_info

}  // namespace quor

#endif
