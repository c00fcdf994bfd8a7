// A record is its size, the offset of each text (0 for NULL) and the texts, each with a terminating zero byte. Numbers
// have 16 bits, or 32 after a zero in place of the size when the record is too long for that. Nothing is aligned.
#include "platform/db/result.h"

#include <charconv>
#include <climits>
#include <cstring>
#include <limits>
#include <new>

#include "base/guarded.h"

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

[[gnu::always_inline]] inline Field readInteger(sqlite3_value* value, char (&digits)[kDecimalDigits]) {
    const char* end = std::to_chars(digits, digits + sizeof digits, sqlite3_value_int64(value)).ptr;
    return {digits, static_cast<size_t>(end - digits)};
}

Field readBlob(sqlite3_value* value) {
    const void* bytes = sqlite3_value_blob(value);
    const auto size = static_cast<size_t>(sqlite3_value_bytes(value));
    if (bytes == nullptr && size != 0) {
        throw std::bad_alloc();
    }
    return {bytes != nullptr ? static_cast<const char*>(bytes) : "", size};
}

[[gnu::always_inline]] inline Field readText(sqlite3_value* value) {
    const unsigned char* text = sqlite3_value_text(value);
    if (text == nullptr) {
        throw std::bad_alloc();
    }
    return {reinterpret_cast<const char*>(text), static_cast<size_t>(sqlite3_value_bytes(value))};
}

[[gnu::always_inline]] inline Field readField(sqlite3_value* value, char (&digits)[kDecimalDigits]) {
    switch (sqlite3_value_type(value)) {
    case SQLITE_NULL:
        return {nullptr, 0};
    case SQLITE_INTEGER:
        return readInteger(value, digits);
    case SQLITE_BLOB:
        return readBlob(value);
    default:
        return readText(value);
    }
}

// Names are short: calling strcmp costs more than comparing.
inline bool same(const std::string& name, const char* text) {
    const char* own = name.c_str();
    const size_t size = name.size();
    size_t i = 0;
    while (i <= size && own[i] == text[i]) {
        ++i;
    }
    return i > size;
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
    columns_.reserve(count);
    for (size_t i = 0; i < count; ++i) {
        const char* name = sqlite3_column_name(statement, static_cast<int>(i));
        columns_.push_back({name != nullptr ? name : "", i, (i + 1) % count});
        columns_[i].first = find(columns_[i].name.c_str());
    }
}

// Writes the row as the arena's next record of `size` bytes.
template <typename Offset>
DBResult_tag::Written DBResult_tag::write(sqlite3_stmt* statement, size_t& size) {
    char digits[kDecimalDigits];
    const auto count = static_cast<int>(columns_.size());
    size_t used = kOffsets<Offset> + columns_.size() * sizeof(Offset);
    if (!arena_.reserve(0, used)) {
        return Written::NoRoom;
    }
    for (int i = 0; i < count; ++i) {
        const Field field = readField(sqlite3_column_value(statement, i), digits);
        const size_t end = field.text != nullptr ? used + field.size + 1 : used;
        if (end > std::numeric_limits<Offset>::max()) {
            return Written::TooLong;
        }
        if (!arena_.reserve(used, end)) {
            return Written::NoRoom;
        }
        char* record = arena_.record();
        store<Offset>(record + kOffsets<Offset> + static_cast<size_t>(i) * sizeof(Offset), end > used ? used : 0);
        if (end > used) {
            memcpy(record + used, field.text, field.size);
            record[end - 1] = '\0';
        }
        used = end;
    }
    size = used;
    return Written::Done;
}

bool DBResult_tag::append(sqlite3_stmt* statement) {
    if (rows_ == INT_MAX) {
        return false;
    }
    size_t size = 0;
    Written written = write<uint16_t>(statement, size);
    if (written == Written::Done) {
        store<uint16_t>(arena_.record(), size);
    } else if (written == Written::TooLong) {
        written = write<uint32_t>(statement, size);
        store<uint16_t>(arena_.record(), 0);
        store<uint32_t>(arena_.record() + sizeof(uint16_t), size);
    }
    if (written != Written::Done) {
        return false;
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

const char* DBResult_tag::field(uint32_t row, const char* name) {
    if (row != current_ && !seek(row)) {
        return nullptr;
    }
    // Callers ask for the same columns in the same order for every row.
    if (!same(columns_[expected_].name, name)) {
        const size_t found = find(name);
        if (found == columns_.size()) {
            return nullptr;
        }
        expected_ = columns_[last_].successor = found;  // now, and after the last one
    }
    last_ = columns_[expected_].first;
    expected_ = columns_[last_].successor;
    return fieldOf(record_, last_);
}

// The first column of that name; their number when there is none.
size_t DBResult_tag::find(const char* name) const {
    size_t i = 0;
    while (i < columns_.size() && !same(columns_[i].name, name)) {
        ++i;
    }
    return i;
}

// A walk goes on from the row before; any other row is found from the mark before it.
bool DBResult_tag::seek(uint32_t row) {
    if (row >= rows_) {
        return false;
    }
    if (row < current_ || row - current_ >= kStride) {
        moveTo(marks_[row / kStride]);
        current_ = row - row % kStride;
    }
    for (; current_ < row; ++current_) {
        moveTo(arena_.after(position_, recordSize(arena_.at(position_))));
    }
    record_ = arena_.at(position_);
    return true;
}

void DBResult_tag::moveTo(Position position) {
    if (position.chunk != position_.chunk) {
        arena_.goOn(position_.chunk, position.chunk);
    }
    position_ = position;
}

int QUORDBFetchRow(DBResult_tag* result, unsigned int* row) {
    return !quor::AnyNull(result, row) && result->next(*row) ? 0 : -1;
}

const char* QUORDBFetchField(DBResult_tag* result, unsigned int row, const char* column) {
    return quor::AnyNull(result, column) ? nullptr : result->field(row, column);
}

int QUORDBNumRows(DBResult_tag* result) {
    return result != nullptr ? static_cast<int>(result->rows()) : 0;
}

void QUORDBFreeResult(DBResult_tag* result) {
    delete result;
}
