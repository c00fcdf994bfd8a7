#include "store/shape.h"

#include <sqlite3.h>

#include <new>

namespace quor::store {
namespace {

bool isDigit(char c) {
    return c >= '0' && c <= '9';
}

void shape(sqlite3_context* context, int /*count*/, sqlite3_value** values) try {
    const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(values[0]));
    if (text != nullptr) {
        const std::string made = ShapeOf({text, static_cast<size_t>(sqlite3_value_bytes(values[0]))});
        sqlite3_result_text(context, made.data(), static_cast<int>(made.size()), SQLITE_TRANSIENT);
    }
} catch (const std::bad_alloc&) {
    sqlite3_result_error_nomem(context);
}

}  // namespace

std::string ShapeOf(std::string_view text) {
    std::string made(text.size(), kNumberMark);
    size_t length = 0;
    bool number = false;
    for (const char c : text) {
        const bool digit = isDigit(c);
        if (!digit || !number) {
            made[length++] = digit ? kNumberMark : c;
        }
        number = digit;
    }
    made.resize(length);
    return made;
}

void AddShape(const Connection& connection) {
    auto* db = static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection.get()));
    constexpr int kFlags = SQLITE_UTF8 | SQLITE_DETERMINISTIC | SQLITE_DIRECTONLY;
    (void)sqlite3_create_function_v2(db, "shape", 1, kFlags, nullptr, shape, nullptr, nullptr, nullptr);
}

}  // namespace quor::store
