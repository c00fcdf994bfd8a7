// An archive whose parts hold any bytes, and bytes that pass for right ones: it is read, searched, checked and deleted
// from without harm, and answers with rows or an error.
#include <sqlite3.h>
#include <unistd.h>

#include "fuzz/fuzz.h"
#include "platform/archive/blockhead.h"
#include "quor/quorarchive.h"
#include "quor/quordb.h"

using quor::fuzz::Require;

namespace {

// A small archive of two blocks.
std::string soundArchive() {
    const std::string plain = quor::fuzz::ScratchPath("plain.db");
    const std::string archive = quor::fuzz::ScratchPath("sound.qar");
    sqlite3* db = nullptr;
    sqlite3_open(plain.c_str(), &db);
    sqlite3_exec(
        db,
        "CREATE TABLE logs (id INTEGER PRIMARY KEY, msg TEXT, host TEXT, utcsec INTEGER, pid TEXT, other);"
        "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 9000) INSERT INTO logs SELECT "
        "i * 2 - i % 3, 'a message of some length ' || i, 'host' || (i % 5), i * 7, hex(i * 31), iif(i % 3, i, 'x')"
        " FROM n",
        nullptr, nullptr, nullptr);
    sqlite3_close(db);
    Require(QUORArchiveWrite(plain.c_str(), archive.c_str(), nullptr, nullptr, nullptr) == 0, "the archive is written");
    return quor::fuzz::ReadFile(archive);
}

std::string partOf(sqlite3* db, const char* sql) {
    sqlite3_stmt* query = nullptr;
    sqlite3_prepare_v2(db, sql, -1, &query, nullptr);
    std::string part;
    if (sqlite3_step(query) == SQLITE_ROW) {
        part.assign(static_cast<const char*>(sqlite3_column_blob(query, 0)),
                    static_cast<size_t>(sqlite3_column_bytes(query, 0)));
    }
    sqlite3_finalize(query);
    return part;
}

void damage(std::string& bytes, FuzzedDataProvider& data) {
    for (int i = data.ConsumeIntegralInRange(1, 4); i > 0 && !bytes.empty(); --i) {
        const size_t at = data.ConsumeIntegralInRange<size_t>(0, bytes.size() - 1);
        const std::string other = quor::fuzz::AnyText(data, 12);
        bytes.replace(at, data.ConsumeIntegralInRange<size_t>(0, 12), other);
    }
}

void damageParts(sqlite3* db, FuzzedDataProvider& data) {
    const bool head = data.ConsumeBool();
    std::string part = partOf(db, head ? "SELECT head FROM logs_blocks" : "SELECT data FROM logs_data");
    damage(part, data);
    if (head && part.size() > 8 && data.ConsumeBool()) {  // as somebody would who means harm
        std::string sum;
        quor::archive::PutFixed(sum, quor::archive::Checksum(std::string_view(part).substr(8)));
        part.replace(0, 8, sum);
    }
    sqlite3_stmt* update = nullptr;
    sqlite3_prepare_v2(db,
                       head ? "UPDATE logs_blocks SET head = ?1 WHERE id = (SELECT min(id) FROM logs_blocks)"
                            : "UPDATE logs_data SET data = ?1 WHERE id = (SELECT min(id) FROM logs_data)",
                       -1, &update, nullptr);
    sqlite3_bind_blob(update, 1, part.data(), static_cast<int>(part.size()), SQLITE_STATIC);
    sqlite3_step(update);
    sqlite3_finalize(update);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    static const std::string sound = soundArchive();
    FuzzedDataProvider data(bytes, size);
    const std::string path = quor::fuzz::ScratchPath("damaged.qar");
    quor::fuzz::WriteFile(path, sound);
    sqlite3* db = nullptr;
    sqlite3_open(path.c_str(), &db);
    sqlite3_exec(db, "PRAGMA synchronous = OFF; PRAGMA journal_mode = OFF", nullptr, nullptr, nullptr);
    damageParts(db, data);
    sqlite3_close(db);
    DBConnect_tag* connection = QUORDBConnect(nullptr, nullptr, nullptr, path.c_str());
    for (const char* sql :
         {"SELECT * FROM logs ORDER BY id DESC", "SELECT count(*) FROM logs WHERE msg GLOB '*some length 77*'",
          "SELECT * FROM logs WHERE host IN ('host1', 'x') AND id > 4000", "SELECT max(rowid) FROM logs",
          "SELECT DISTINCT host FROM logs", "DELETE FROM logs WHERE host = 'host2'"}) {
        DBResult_tag* result = nullptr;
        (void)QUORDBExecute(connection, sql, &result);
        QUORDBFreeResult(result);
    }
    QUORDBClose(connection);
    QUORARCHIVE report;
    const int status = QUORArchiveCheck(path.c_str(), nullptr, nullptr, nullptr, &report);
    Require((status == 0) == (report.error[0] == '\0'), "a failure has its reason");
    unlink(path.c_str());
    return 0;
}
