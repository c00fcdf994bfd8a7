#include "platform/archive/cell.h"

#include <cstring>
#include <new>

namespace quor::archive {
namespace {

double realOf(const Cell& cell) {
    double real = 0;
    static_assert(sizeof real == sizeof cell.number);
    memcpy(&real, &cell.number, sizeof real);
    return real;
}

Cell realCell(double real) {
    Cell cell{Cell::Kind::Real, 0, {}};
    memcpy(&cell.number, &real, sizeof real);
    return cell;
}

// SQLite counts a text that is said to end at its zero byte as ended, and need not copy it to end it.
int sizeOfEnded(std::string_view text) {
    return text.find('\0') == std::string_view::npos ? -1 : static_cast<int>(text.size());
}

std::string_view bytesOf(sqlite3_value* value, const void* bytes) {
    if (bytes == nullptr && sqlite3_value_bytes(value) > 0) {
        throw std::bad_alloc();
    }
    return {bytes != nullptr ? static_cast<const char*>(bytes) : "", static_cast<size_t>(sqlite3_value_bytes(value))};
}

}  // namespace

void PutCell(std::string& out, const Cell& cell) {
    PutByte(out, static_cast<uint8_t>(cell.kind));
    switch (cell.kind) {
    case Cell::Kind::Integer:
        PutSigned(out, cell.integer());
        break;
    case Cell::Kind::Real:
        PutFixed(out, cell.number);
        break;
    case Cell::Kind::Text:
    case Cell::Kind::Blob:
        PutNumber(out, cell.bytes.size());
        out.append(cell.bytes).push_back('\0');
        break;
    case Cell::Kind::Null:
        break;
    }
}

Cell TakeCell(Bytes& bytes) {
    Cell cell;
    cell.kind = static_cast<Cell::Kind>(bytes.byte());
    switch (cell.kind) {
    case Cell::Kind::Integer:
        cell.number = static_cast<uint64_t>(bytes.signedNumber());
        break;
    case Cell::Kind::Real:
        cell.number = bytes.fixed();
        break;
    case Cell::Kind::Text:
    case Cell::Kind::Blob:
        cell.bytes = bytes.take(bytes.numberUpTo(kLongestValue));
        Demand(bytes.byte() == 0, "a text without an end");
        break;
    case Cell::Kind::Null:
        break;
    default:
        throw Damaged("a value of no known type");
    }
    return cell;
}

Cell CellOf(sqlite3_value* value) {
    switch (sqlite3_value_type(value)) {
    case SQLITE_INTEGER:
        return IntegerCell(sqlite3_value_int64(value));
    case SQLITE_FLOAT:
        return realCell(sqlite3_value_double(value));
    case SQLITE_TEXT:
        return {Cell::Kind::Text, 0, bytesOf(value, sqlite3_value_text(value))};
    case SQLITE_BLOB:
        return {Cell::Kind::Blob, 0, bytesOf(value, sqlite3_value_blob(value))};
    default:
        return {};
    }
}

void SetResult(sqlite3_context* context, const Cell& cell, Lasting lasting) {
    // NOLINTNEXTLINE(performance-no-int-to-ptr): SQLite's own constant
    const sqlite3_destructor_type release = lasting == Lasting::Always ? SQLITE_STATIC : SQLITE_TRANSIENT;
    switch (cell.kind) {
    case Cell::Kind::Integer:
        sqlite3_result_int64(context, cell.integer());
        break;
    case Cell::Kind::Real:
        sqlite3_result_double(context, realOf(cell));
        break;
    case Cell::Kind::Text:
        sqlite3_result_text(context, cell.bytes.data(), sizeOfEnded(cell.bytes), release);
        break;
    case Cell::Kind::Blob:
        sqlite3_result_blob64(context, cell.bytes.data(), cell.bytes.size(), release);
        break;
    case Cell::Kind::Null:
        sqlite3_result_null(context);
        break;
    }
}

int Bind(sqlite3_stmt* statement, int index, const Cell& cell) {
    switch (cell.kind) {
    case Cell::Kind::Integer:
        return sqlite3_bind_int64(statement, index, cell.integer());
    case Cell::Kind::Real:
        return sqlite3_bind_double(statement, index, realOf(cell));
    case Cell::Kind::Text:
        return sqlite3_bind_text64(statement, index, cell.bytes.data(), cell.bytes.size(), SQLITE_STATIC, SQLITE_UTF8);
    case Cell::Kind::Blob:
        return sqlite3_bind_blob64(statement, index, cell.bytes.data(), cell.bytes.size(), SQLITE_STATIC);
    case Cell::Kind::Null:
        break;
    }
    return sqlite3_bind_null(statement, index);
}

}  // namespace quor::archive
