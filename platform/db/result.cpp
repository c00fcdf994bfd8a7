// A record is its size, the offset of each text (0 for NULL) and the texts, each with a terminating zero byte. Numbers
// have 16 bits, or 32 after a zero in place of the size when the record is too long for that. Nothing is aligned.
#include "result.h"

#include <charconv>
#include <climits>
#include <cstring>
#include <limits>
#include <new>

namespace {

constexpr uint32_t kStride = 64;
constexpr size_t kDecimalDigits = 24;

struct Field {
    const char* text;  // null for NULL
    size_t size;
};

template <typename Number>
Number load(const char* from) {
    Number number;
    memcpy(&number, from, sizeof number);
    return number;
}

template <typename Number>
void store(char* to, size_t number) {
    const auto narrowed = static_cast<Number>(number);
    memcpy(to, &narrowed, sizeof narrowed);
}

// Where the offsets begin.
template <typename Offset>
constexpr size_t kOffsets = sizeof(Offset) == sizeof(uint16_t) ? sizeof(uint16_t) : sizeof(uint16_t) + sizeof(uint32_t);

Field readInteger(sqlite3_value* value, char (&digits)[kDecimalDigits]) {
    const char* end = std::to_chars(digits, digits + sizeof digits, sqlite3_value_int64(value)).ptr;
    return {digits, static_cast<size_t>(end - digits)};
}

Field readBytes(sqlite3_value* value, const void* bytes) {
    const auto size = static_cast<size_t>(sqlite3_value_bytes(value));
    if (bytes == nullptr && (size != 0 || sqlite3_value_type(value) != SQLITE_BLOB)) {
        throw std::bad_alloc();
    }
    return {bytes != nullptr ? static_cast<const char*>(bytes) : "", size};
}

Field readField(sqlite3_value* value, char (&digits)[kDecimalDigits]) {
    switch (sqlite3_value_type(value)) {
    case SQLITE_NULL:
        return {nullptr, 0};
    case SQLITE_INTEGER:
        return readInteger(value, digits);
    case SQLITE_BLOB:
        return readBytes(value, sqlite3_value_blob(value));
    default:
        return readBytes(value, sqlite3_value_text(value));
    }
}

size_t recordSize(const char* record) {
    const auto size = load<uint16_t>(record);
    return size != 0 ? size : load<uint32_t>(record + sizeof size);
}

const char* fieldOf(const char* record, size_t column) {
    const size_t offset = load<uint16_t>(record) != 0
                              ? load<uint16_t>(record + kOffsets<uint16_t> + column * sizeof(uint16_t))
                              : load<uint32_t>(record + kOffsets<uint32_t> + column * sizeof(uint32_t));
    return offset != 0 ? record + offset : nullptr;
}

}  // namespace

void DBResult_tag::setColumns(sqlite3_stmt* statement) {
    const auto count = static_cast<size_t>(sqlite3_column_count(statement));
    names_.reserve(count);
    for (size_t i = 0; i < count; ++i) {
        const char* name = sqlite3_column_name(statement, static_cast<int>(i));
        names_.emplace_back(name != nullptr ? name : "");
        successors_.push_back(static_cast<uint16_t>((i + 1) % count));
    }
    lastColumn_ = count - 1;
}

// Writes the row as the arena's next record. The size is 0 when the row needs wider offsets.
template <typename Offset>
bool DBResult_tag::write(sqlite3_stmt* statement, size_t& size) {
    char digits[kDecimalDigits];
    size = 0;
    size_t used = kOffsets<Offset> + names_.size() * sizeof(Offset);
    if (!arena_.reserve(0, used)) {
        return false;
    }
    for (size_t i = 0; i < names_.size(); ++i) {
        const Field field = readField(sqlite3_column_value(statement, static_cast<int>(i)), digits);
        char* offset = arena_.record() + kOffsets<Offset> + i * sizeof(Offset);
        if (field.text == nullptr) {
            store<Offset>(offset, 0);
            continue;
        }
        const size_t end = used + field.size + 1;
        if (end > std::numeric_limits<Offset>::max()) {
            return sizeof(Offset) == sizeof(uint16_t);
        }
        store<Offset>(offset, used);
        if (!arena_.reserve(used, end)) {
            return false;
        }
        memcpy(arena_.record() + used, field.text, field.size);
        arena_.record()[end - 1] = '\0';
        used = end;
    }
    size = used;
    return true;
}

bool DBResult_tag::append(sqlite3_stmt* statement) {
    size_t size = 0;
    if (rows_ == INT_MAX || !write<uint16_t>(statement, size)) {
        return false;
    }
    if (size != 0) {
        store<uint16_t>(arena_.record(), size);
    } else {
        if (!write<uint32_t>(statement, size)) {
            return false;
        }
        store<uint16_t>(arena_.record(), 0);
        store<uint32_t>(arena_.record() + sizeof(uint16_t), size);
    }
    const Position position = arena_.commit(size);
    if (rows_ % kStride == 0) {
        marks_.push_back(position);
    }
    ++rows_;
    return true;
}

bool DBResult_tag::finish() {
    return arena_.finish();
}

bool DBResult_tag::next(uint32_t& row) {
    if (next_ == rows_) {
        return false;
    }
    row = next_++;
    return true;
}

const char* DBResult_tag::field(uint32_t row, const char* column) {
    const int number = row < rows_ ? columnNumber(column) : -1;
    return number >= 0 ? fieldOf(record(row), static_cast<size_t>(number)) : nullptr;
}

// Callers ask for the same columns in the same order for every row.
int DBResult_tag::columnNumber(const char* name) {
    const size_t guess = successors_[lastColumn_];
    size_t found = guess;
    if (names_[guess] != name) {
        found = 0;
        while (found < names_.size() && names_[found] != name) {
            ++found;
        }
        if (found == names_.size()) {
            return -1;
        }
        successors_[lastColumn_] = static_cast<uint16_t>(found);
    }
    lastColumn_ = found;
    return static_cast<int>(found);
}

// A walk goes on from the row before; any other row is found from the mark before it.
const char* DBResult_tag::record(uint32_t row) {
    if (row < current_ || row - current_ >= kStride) {
        moveTo(marks_[row / kStride]);
        current_ = row / kStride * kStride;
    }
    while (current_ < row) {
        moveTo(arena_.after(position_, recordSize(arena_.at(position_))));
        ++current_;
    }
    return arena_.at(position_);
}

void DBResult_tag::moveTo(Position position) {
    if (position.chunk != position_.chunk) {
        arena_.leave(position_.chunk);
    }
    position_ = position;
}

int QUORDBFetchRow(DBResult_tag* result, unsigned int* row) {
    return result != nullptr && row != nullptr && result->next(*row) ? 0 : -1;
}

const char* QUORDBFetchField(DBResult_tag* result, unsigned int row, const char* column) {
    return result != nullptr && column != nullptr ? result->field(row, column) : nullptr;
}

int QUORDBNumRows(DBResult_tag* result) {
    return result != nullptr ? static_cast<int>(result->rows()) : 0;
}

void QUORDBFreeResult(DBResult_tag* result) {
    delete result;
}
