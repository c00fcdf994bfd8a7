#include "bench/search/tables.h"

#include <sqlite3.h>

#include <filesystem>
#include <fstream>
#include <iterator>
#include <map>
#include <memory>
#include <stdexcept>

#include "bench/search/rows.h"

namespace quor::bench {
namespace {

constexpr const char* kPlainSchema =
    "CREATE TABLE logs(id INTEGER PRIMARY KEY AUTOINCREMENT, host TEXT, ip TEXT, fac TEXT, prio TEXT,"
    " llevel TEXT GENERATED ALWAYS AS (prio) VIRTUAL, tag TEXT, utcsec INTEGER, tzoffset TEXT, ldate TEXT, ltime TEXT,"
    " prog TEXT, msg TEXT);";

constexpr const char* kInsert = "INSERT INTO logs(host, ip, fac, prio, tag, utcsec, tzoffset, ldate, ltime, prog, msg)"
                                " VALUES(?1, ?2, ?3, ?4, ?5, ?6, ?7, ?8, ?9, ?10, ?11)";

using Database = std::unique_ptr<sqlite3, decltype(&sqlite3_close)>;
using Statement = std::unique_ptr<sqlite3_stmt, decltype(&sqlite3_finalize)>;

void check(sqlite3* db, bool good) {
    if (!good) {
        throw std::runtime_error(sqlite3_errmsg(db));
    }
}

void run(sqlite3* db, const std::string& sql) {
    check(db, sqlite3_exec(db, sql.c_str(), nullptr, nullptr, nullptr) == SQLITE_OK);
}

std::string schemaOf(Layout layout) {
    if (layout == Layout::kPlain) {
        return kPlainSchema;
    }
    std::ifstream file(BENCH_SCHEMA);
    return {std::istreambuf_iterator<char>(file), {}};
}

void insert(sqlite3_stmt* statement, const Row& row) {
    int column = 0;
    const auto bind = [&](const std::string& text) {
        sqlite3_bind_text(statement, ++column, text.c_str(), -1, SQLITE_STATIC);
    };
    for (const std::string* text : {&row.host, &row.ip, &row.fac, &row.prio, &row.tag}) {
        bind(*text);
    }
    sqlite3_bind_int64(statement, ++column, row.utcsec);
    for (const std::string* text : {&row.tzoffset, &row.ldate, &row.ltime, &row.prog, &row.msg}) {
        bind(*text);
    }
    sqlite3_step(statement);
    sqlite3_reset(statement);
}

void fill(const std::string& path, int64_t rows, Layout layout) {
    sqlite3* raw = nullptr;
    const int opened = sqlite3_open(path.c_str(), &raw);
    const Database db(raw, sqlite3_close);
    check(raw, opened == SQLITE_OK);
    run(raw, schemaOf(layout));
    run(raw, "PRAGMA synchronous=OFF; PRAGMA journal_mode=OFF; PRAGMA cache_size=-500000; BEGIN");
    sqlite3_stmt* prepared = nullptr;
    check(raw, sqlite3_prepare_v2(raw, kInsert, -1, &prepared, nullptr) == SQLITE_OK);
    const Statement statement(prepared, sqlite3_finalize);
    RowSource source(rows);
    for (int64_t i = 0; i < rows; ++i) {
        insert(prepared, source.next());
    }
    run(raw, "COMMIT; PRAGMA journal_mode=WAL");
}

// Stays open like the log writer's connection, so that no measured one is the last to close and tidies up.
void keepOpen(const std::string& path) {
    static std::map<std::string, Database> writers;
    if (writers.count(path) == 0) {
        sqlite3* raw = nullptr;
        sqlite3_open(path.c_str(), &raw);
        writers.emplace(path, Database(raw, sqlite3_close));
        run(raw, "SELECT 1 FROM logs LIMIT 1");
    }
}

}  // namespace

std::string TablePath(int64_t rows, Layout layout) {
    namespace fs = std::filesystem;
    const fs::path folder = BENCH_DATA;
    fs::create_directories(folder);
    const fs::path path = folder / (std::to_string(rows) + (layout == Layout::kShipped ? "-shipped.db" : "-plain.db"));
    if (!fs::exists(path)) {
        const fs::path half = path.string() + ".half";  // nothing half made is ever used
        fs::remove(half);
        fill(half, rows, layout);
        fs::rename(half, path);
    }
    keepOpen(path);
    return path;
}

}  // namespace quor::bench
