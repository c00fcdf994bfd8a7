#include <cstring>

#include "dbutil.h"
#include "quor/quordb.h"

namespace {

enum Operator : int { kLike = 6, kNotLike = 7, kGlob = 8, kNotGlob = 9 };

bool isLike(int op) {
    return op == kLike || op == kNotLike;
}

bool isGlob(int op) {
    return op == kGlob || op == kNotGlob;
}

bool isNumeric(_SYSLOG_DB_ATTRI_tag attr) {
    return attr == SYSLOG_ATTRI_ID || attr == SYSLOG_ATTRI_UTCSEC;
}

// Runs one of the wrapper's escapes into a buffer of twice the text plus one, which always suffices. Empty on failure.
template <typename Escape>
std::string escaped(const std::string& text, Escape escape) {
    std::string buffer(2 * text.size() + 1, '\0');
    if (escape(buffer.data(), static_cast<unsigned int>(buffer.size())) < 0) {
        return {};
    }
    buffer.resize(strlen(buffer.c_str()));
    return buffer;
}

std::string quoteEscaped(const std::string& text) {
    return escaped(text, [&](char* out, unsigned int size) {
        return QUORDBEscapeStringEX2(nullptr, out, size, text.c_str(), static_cast<unsigned int>(text.size()));
    });
}

// "*" and "?" become LIKE's wildcards after its own were escaped.
std::string likePattern(const std::string& text) {
    std::string pattern = escaped(
        text, [&](char* out, unsigned int size) { return QUORDBEscapeBackslashEX2(nullptr, out, size, text.c_str()); });
    for (char& c : pattern) {
        if (c == '*') {
            c = '%';
        } else if (c == '?') {
            c = '_';
        }
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

std::string CondValueEscape(const _SYSLOG_SQL_COND_tag* cond) {
    if (cond == nullptr) {
        return {};
    }
    std::string value = quoteEscaped(cond->value);
    if (isLike(cond->op)) {
        return likePattern(value);
    }
    return isGlob(cond->op) ? globPattern(value) : value;
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
