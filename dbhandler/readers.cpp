#include "dbhandler/readers.h"

#include "common/handles.h"
#include "dbhandler.h"

namespace quor {

int ReadTime(DBResult_tag* result, void* info) {
    Row row(result);
    if (!row.next()) {
        return -1;
    }
    static_cast<_ARCH_DB_INFO_tag*>(info)->start_time = ToInt32(row["utcsec"]);
    return 0;
}

int ReadCount(DBResult_tag* result, void* info) {
    Row row(result);
    if (!row.next()) {
        return -1;
    }
    const int64_t count = ToInt32(row["count_result"]);
    static_cast<_ARCH_DB_INFO_tag*>(info)->log_count = static_cast<uint64_t>(count);
    return 0;
}

int ReadInfo(DBResult_tag* result, void* info) {
    Row row(result);
    if (!row.next()) {
        return -1;
    }
    auto& target = *static_cast<_ARCH_DB_INFO_tag*>(info);
    target.start_time = ToInt32(row["start_time"]);
    target.end_time = ToInt32(row["end_time"]);
    target.log_count = ToUint64(row["log_count"]);
    target.device = row["device"];
    return 0;
}

}  // namespace quor
