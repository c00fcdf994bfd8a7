// Any schema and any rows: the wrapper's result holds what SQLite holds.
#include <sqlite3.h>

#include "common/handles.h"
#include "dbutil.h"
#include "fuzz/fuzz.h"

using quor::fuzz::Require;

namespace {

void bind(sqlite3_stmt* statement, int index, FuzzedDataProvider& data) {
    switch (data.ConsumeIntegralInRange(0, 4)) {
    case 0:
        sqlite3_bind_null(statement, index);
        break;
    case 1:
        sqlite3_bind_int64(statement, index, data.ConsumeIntegral<int64_t>());
        break;
    case 2:
        sqlite3_bind_double(statement, index, data.ConsumeFloatingPoint<double>());
        break;
    case 3:
        sqlite3_bind_zeroblob(statement, index, data.ConsumeIntegralInRange(0, 70000));
        break;
    default:
        const std::string text = quor::fuzz::AnyText(data, 60);
        sqlite3_bind_text(statement, index, text.c_str(), static_cast<int>(text.size()), SQLITE_TRANSIENT);
    }
}

// A table with columns of random names, some of them those that the library reads.
void fill(sqlite3* db, int columns, FuzzedDataProvider& data) {
    std::string create = "CREATE TABLE logs(";
    std::string insert = "INSERT INTO logs VALUES(";
    for (int i = 0; i < columns; ++i) {
        const std::string known = LogAttriStrGet(static_cast<_SYSLOG_DB_ATTRI_tag>(data.ConsumeIntegralInRange(0, 17)));
        create += (i > 0 ? ", " : "") + known + (data.ConsumeBool() ? "" : std::to_string(i));
        insert += i > 0 ? ", ?" : "?";
    }
    sqlite3_exec(db, ("DROP TABLE IF EXISTS logs; BEGIN; " + create + ")").c_str(), nullptr, nullptr, nullptr);
    sqlite3_stmt* statement = nullptr;  // none for two columns of one name
    sqlite3_prepare_v2(db, (insert + ")").c_str(), -1, &statement, nullptr);
    for (int row = 0; row < 80 && data.remaining_bytes() > 0; ++row) {
        for (int i = 1; i <= columns; ++i) {
            bind(statement, i, data);
        }
        sqlite3_step(statement);
        sqlite3_reset(statement);
    }
    sqlite3_finalize(statement);
    sqlite3_exec(db, "COMMIT", nullptr, nullptr, nullptr);
}

void compare(sqlite3* db, DBResult_tag* result) {
    sqlite3_stmt* statement = nullptr;
    sqlite3_prepare_v2(db, "SELECT * FROM logs", -1, &statement, nullptr);
    unsigned int row = 0;
    while (sqlite3_step(statement) == SQLITE_ROW) {
        Require(QUORDBFetchRow(result, &row) >= 0, "as many rows");
        for (int i = sqlite3_column_count(statement) - 1; i >= 0; --i) {
            const auto* expected = reinterpret_cast<const char*>(sqlite3_column_text(statement, i));
            const char* found = QUORDBFetchField(result, row, sqlite3_column_name(statement, i));
            Require((expected == nullptr) == (found == nullptr), "NULL stays NULL");
            Require(expected == nullptr || std::string(expected) == found, "the same text");
        }
    }
    Require(QUORDBFetchRow(result, &row) < 0, "no other row");
    sqlite3_finalize(statement);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    FuzzedDataProvider data(bytes, size);
    const std::string path = quor::fuzz::ScratchPath("result.db");
    static sqlite3* db = nullptr;
    if (db == nullptr) {
        sqlite3_open(path.c_str(), &db);
        sqlite3_exec(db, "PRAGMA synchronous=OFF; PRAGMA journal_mode=MEMORY", nullptr, nullptr, nullptr);
    }
    fill(db, data.ConsumeIntegralInRange(1, 8), data);
    const quor::Connection connection(QUORDBConnect(nullptr, nullptr, nullptr, path.c_str()));
    quor::Result result;
    if (QUORDBExecute(connection.get(), "SELECT * FROM logs", quor::Adopt(result)) < 0) {
        return 0;
    }
    for (int row = QUORDBNumRows(result.get()) - 1; row >= 0; row -= 7) {
        _SYSLOG_LOG_DATA_tag record;
        for (std::string table : {"logs", "general_log", "transfer_log"}) {
            (void)DBRecToLogInfo(table, result.get(), static_cast<unsigned int>(row), &record, true);
        }
    }
    compare(db, result.get());
    return 0;
}
