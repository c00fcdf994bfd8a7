// One value of one row, with its type.
#ifndef PLATFORM_ARCHIVE_CELL_H
#define PLATFORM_ARCHIVE_CELL_H

#include <sqlite3.h>

#include <cstdint>
#include <string>
#include <string_view>

#include "platform/archive/bytes.h"

namespace quor::archive {

// The bytes belong to somebody else. Those that were read from an archive have a zero byte behind them.
struct Cell {
    enum class Kind : uint8_t {
        Integer = SQLITE_INTEGER,
        Real = SQLITE_FLOAT,
        Text = SQLITE_TEXT,
        Blob = SQLITE_BLOB,
        Null = SQLITE_NULL,
    };

    Kind kind = Kind::Null;
    uint64_t number = 0;  // of an integer, or the bits of a real number
    std::string_view bytes;

    int64_t integer() const { return static_cast<int64_t>(number); }
    bool isText() const { return kind == Kind::Text; }
};

inline bool operator==(const Cell& a, const Cell& b) {
    return a.kind == b.kind && a.number == b.number && a.bytes == b.bytes;
}

inline Cell IntegerCell(int64_t value) {
    return {Cell::Kind::Integer, static_cast<uint64_t>(value), {}};
}

// No longer value is archived, so that a reader knows how much memory a sound block can ask for.
constexpr uint64_t kLongestValue = uint64_t{16} << 20U;

void PutCell(std::string& out, const Cell& cell);
Cell TakeCell(Bytes& bytes);

// A value of SQLite's, valid as long as that. Throws std::bad_alloc.
Cell CellOf(sqlite3_value* value);
// How long the bytes of a cell stay where they are: for now, or as long as anybody may ask.
enum class Lasting { Now, Always };
void SetResult(sqlite3_context* context, const Cell& cell, Lasting lasting);
int Bind(sqlite3_stmt* statement, int index, const Cell& cell);

}  // namespace quor::archive

#endif
