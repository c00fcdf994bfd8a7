#include "store/regex.h"

#include <re2/re2.h>
#include <sqlite3.h>

#include <algorithm>
#include <memory>
#include <new>
#include <string_view>

#include "base/utf8.h"
#include "store/failure.h"

namespace quor::store {
namespace {

constexpr int64_t kMemory = int64_t{8} << 20;  // of one pattern; past it matching is slower, but still linear

// A message is one text, whatever line ends it holds.
RE2::Options options() {
    RE2::Options options(RE2::Quiet);
    options.set_max_mem(kMemory);
    options.set_dot_nl(true);
    options.set_never_capture(true);
    return options;
}

void release(void* expression) {
    delete static_cast<RE2*>(expression);
}

std::string_view textOf(sqlite3_value* value) {
    const auto* text = reinterpret_cast<const char*>(sqlite3_value_text(value));  // before the size, which it decides
    return {text != nullptr ? text : "", static_cast<size_t>(sqlite3_value_bytes(value))};
}

// SQLite keeps the compiled pattern as long as the statement runs. Null when there is no memory to keep it.
const RE2* compiled(sqlite3_context* context, sqlite3_value* pattern) {
    void* kept = sqlite3_get_auxdata(context, 0);
    if (kept == nullptr) {
        auto expression = std::make_unique<RE2>(textOf(pattern), options());
        sqlite3_set_auxdata(context, 0, expression.release(), release);
        kept = sqlite3_get_auxdata(context, 0);
    }
    return static_cast<const RE2*>(kept);
}

// With U+FFFD for every byte that belongs to no character.
std::string repaired(std::string_view text) {
    std::string valid;
    for (size_t at = 0; at < text.size();) {
        const Symbol symbol = NextSymbol(text, at);
        valid += symbol.valid ? text.substr(at, symbol.length) : "\xEF\xBF\xBD";
        at += symbol.length;
    }
    return valid;
}

// A dot stops before a byte that is no UTF-8: whoever sends one must not hide from a pattern what follows it.
bool matches(std::string_view text, const RE2& expression) {
    const bool ascii = std::all_of(text.begin(), text.end(), [](char c) { return (c & 0x80) == 0; });
    return ascii || IsUtf8(text) ? RE2::PartialMatch(text, expression) : RE2::PartialMatch(repaired(text), expression);
}

// "text REGEXP pattern" calls regexp(pattern, text).
void regexp(sqlite3_context* context, int /*count*/, sqlite3_value** values) try {
    if (sqlite3_value_type(values[1]) == SQLITE_NULL) {
        return;  // and the result is null
    }
    const RE2* expression = compiled(context, values[0]);
    if (expression == nullptr) {
        sqlite3_result_error_nomem(context);
    } else if (!expression->ok()) {
        sqlite3_result_error(context, expression->error().c_str(), -1);
    } else {
        sqlite3_result_int(context, matches(textOf(values[1]), *expression) ? 1 : 0);
    }
} catch (const std::bad_alloc&) {
    sqlite3_result_error_nomem(context);
}

}  // namespace

void CheckRegex(const std::string& pattern, bool ignoreCase, const std::string& option) {
    RE2::Options checked = options();
    checked.set_case_sensitive(!ignoreCase);
    const RE2 expression(pattern, checked);
    if (!expression.ok()) {
        throw Failure(option + ": " + expression.error() +
                      "; give a pattern such as 'error [0-9]+|timed out', with \\ before " +
                      "what is meant as it stands");
    }
}

std::string RegexOf(const std::string& pattern, bool ignoreCase) {
    return ignoreCase ? "(?i)" + pattern : pattern;
}

void AddRegexp(const Connection& connection) {
    auto* db = static_cast<sqlite3*>(QUORDBInternalDBHdlGet(connection.get()));
    constexpr int kFlags =
        SQLITE_UTF8 | SQLITE_DETERMINISTIC | SQLITE_DIRECTONLY;  // nothing that a file brings calls it
    (void)sqlite3_create_function_v2(db, "regexp", 2, kFlags, nullptr, regexp, nullptr, nullptr, nullptr);
}

}  // namespace quor::store
