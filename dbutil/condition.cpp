#include <algorithm>
#include <cstring>
#include <new>
#include <optional>

#include "dbutil.h"
#include "quor/quordb.h"

namespace {

bool isLike(int op) {
    return op == SYSLOG_OP_LIKE || op == SYSLOG_OP_NOT_LIKE;
}

bool isGlob(int op) {
    return op == SYSLOG_OP_GLOB || op == SYSLOG_OP_NOT_GLOB;
}

bool isNumeric(_SYSLOG_DB_ATTRI_tag attr) {
    return attr == SYSLOG_ATTRI_ID || attr == SYSLOG_ATTRI_UTCSEC;
}

// Runs one of the wrapper's escapes into a buffer of twice the text plus one, which always suffices. Nothing when it
// fails.
template <typename Escape>
std::optional<std::string> escaped(const std::string& text, Escape escape) {
    std::string buffer(2 * text.size() + 1, '\0');
    if (escape(buffer.data(), static_cast<unsigned int>(buffer.size())) < 0) {
        return std::nullopt;
    }
    buffer.resize(strlen(buffer.c_str()));
    return buffer;
}

std::optional<std::string> quoteEscaped(const std::string& text) {
    return escaped(text, [&](char* out, unsigned int size) {
        return QUORDBEscapeStringEX2(nullptr, out, size, text.c_str(), static_cast<unsigned int>(text.size()));
    });
}

// "*" and "?" become LIKE's wildcards after its own were escaped.
std::optional<std::string> likePattern(const std::string& text) {
    std::optional<std::string> pattern = escaped(
        text, [&](char* out, unsigned int size) { return QUORDBEscapeBackslashEX2(nullptr, out, size, text.c_str()); });
    if (pattern) {
        std::replace(pattern->begin(), pattern->end(), '*', '%');
        std::replace(pattern->begin(), pattern->end(), '?', '_');
    }
    return pattern;
}

// A bracket in brackets matches itself.
std::string globPattern(const std::string& text) {
    std::string pattern;
    pattern.reserve(text.size() + 8);
    for (const char c : text) {
        if (c == '[' || c == ']') {
            pattern.append({'[', c, ']'});
        } else {
            pattern.push_back(c);
        }
    }
    return pattern;
}

const char* operatorText(int op) {
    constexpr int kCount = sizeof(g_MappingSyslogOP) / sizeof(g_MappingSyslogOP[0]);
    return op >= 0 && op < kCount ? g_MappingSyslogOP[op] : "";
}

void appendComparison(const _SYSLOG_SQL_COND_tag& cond, std::string& out) {
    const char* quote = isNumeric(cond.attr) ? "" : "'";
    out.append("(").append(LogAttriStrGet(cond.attr)).append(" ").append(operatorText(cond.op)).append(" ");
    out.append(quote).append(CondValueEscape(&cond)).append(quote);
    if (isLike(cond.op) && !isNumeric(cond.attr)) {
        out.append(" escape '\\'");
    }
    out.append(")");
}

}  // namespace

// A value that cannot be escaped, for want of memory too, becomes the empty one: the condition still renders.
std::string CondValueEscape(const _SYSLOG_SQL_COND_tag* cond) try {
    std::optional<std::string> value = cond != nullptr ? quoteEscaped(cond->value) : std::nullopt;
    if (value && isLike(cond->op)) {
        value = likePattern(*value);
    } else if (value && isGlob(cond->op)) {
        value = globPattern(*value);
    }
    return value.value_or("");
} catch (const std::bad_alloc&) {
    return {};
}

int SqlCondToStr(const _SYSLOG_SQL_COND_tag& cond, std::string& out) {
    std::string text;
    appendComparison(cond, text);
    if (!cond.orList.empty()) {
        text.insert(0, "(");
        for (const _SYSLOG_SQL_COND_tag& alternative : cond.orList) {
            text.append(" OR ");
            appendComparison(alternative, text);
        }
        text.append(")");
    }
    out = std::move(text);
    return 0;
}

int SqlCondListToStr(std::list<_SYSLOG_SQL_COND_tag>& conds, std::string& out) {
    const char* joint = "";
    for (const _SYSLOG_SQL_COND_tag& cond : conds) {
        std::string text;
        if (SqlCondToStr(cond, text) != 0) {
            return -1;
        }
        out.append(joint).append(text);
        joint = " AND ";
    }
    return 0;
}
