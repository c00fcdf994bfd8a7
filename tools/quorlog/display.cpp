#include "tools/quorlog/display.h"

#include <utf8proc.h>

#include <algorithm>
#include <cstdint>

#include "base/json.h"
#include "base/utf8.h"

namespace quor::cli {
namespace {

bool isPrintableAscii(char c) {
    return c >= 0x20 && c < 0x7F;
}

// Characters that are letters or marks by category and show nothing all the same.
bool isBlankLetter(char32_t code) {
    return code == 0x034F || code == 0x115F || code == 0x1160 || code == 0x17B4 || code == 0x17B5 ||
           (code >= 0x180B && code <= 0x180F) || code == 0x3164 || code == 0xFFA0;
}

// Joiners shape scripts and emoji; no terminal is led astray by them.
bool isJoiner(char32_t code) {
    return code == 0x200C || code == 0x200D;
}

void appendByte(std::string& out, uint32_t byte) {
    out += "\\x";
    AppendHex(out, byte, 2);
}

// \n, \t, \r; \xNN; \uNNNN or \UNNNNNNNN
void appendSpelled(std::string& out, char32_t code) {
    constexpr std::string_view kShort = "\n\t\r";
    constexpr std::string_view kLetters = "ntr";
    const size_t known = code < 0x80 ? kShort.find(static_cast<char>(code)) : std::string_view::npos;
    if (known != std::string_view::npos) {
        out += {'\\', kLetters[known]};
    } else if (code < 0x80) {
        appendByte(out, code);
    } else {
        out += code <= 0xFFFF ? "\\u" : "\\U";
        AppendHex(out, code, code <= 0xFFFF ? 4 : 8);
    }
}

bool looksLikeFormula(std::string_view text) {
    return !text.empty() && std::string_view("=+-@\t\r\n'").find(text.front()) != std::string_view::npos;
}

bool needsQuotes(std::string_view text) {
    return text.find_first_of(",\"\r\n") != std::string_view::npos ||
           (!text.empty() && (text.front() == ' ' || text.back() == ' '));
}

}  // namespace

bool IsHidden(char32_t code) {
    switch (utf8proc_category(static_cast<utf8proc_int32_t>(code))) {
    case UTF8PROC_CATEGORY_CC:
    case UTF8PROC_CATEGORY_CN:
    case UTF8PROC_CATEGORY_CS:
    case UTF8PROC_CATEGORY_ZL:
    case UTF8PROC_CATEGORY_ZP:
        return true;
    case UTF8PROC_CATEGORY_CF:
        return !isJoiner(code);
    default:
        return isBlankLetter(code);
    }
}

size_t WidthOf(char32_t code) {
    constexpr char32_t kEmojiForm = 0xFE0F;  // makes the character before it a wide one
    const int width = utf8proc_charwidth(static_cast<utf8proc_int32_t>(code));
    return code == kEmojiForm ? 1 : static_cast<size_t>(std::max(0, width));
}

size_t AppendVisible(std::string& out, std::string_view text) {
    size_t width = 0;
    for (size_t at = 0; at < text.size();) {
        const auto* const begin = text.begin() + at;
        const auto run = static_cast<size_t>(std::find_if_not(begin, text.end(), isPrintableAscii) - begin);
        out.append(text, at, run);
        width += run;
        at += run;
        if (at == text.size()) {
            break;
        }
        const Symbol symbol = NextSymbol(text, at);
        const size_t before = out.size();
        if (symbol.valid && !IsHidden(symbol.code)) {
            out.append(text, at, symbol.length);
            width += WidthOf(symbol.code);
        } else {
            symbol.valid ? appendSpelled(out, symbol.code) : appendByte(out, symbol.code);
            width += out.size() - before;
        }
        at += symbol.length;
    }
    return width;
}

std::string Visible(std::string_view text) {
    std::string out;
    AppendVisible(out, text);
    return out;
}

void AppendVisibleJson(std::string& out, std::string_view text) {
    AppendJsonString(out, text, IsHidden);
}

void AppendCsvCell(std::string& out, std::string_view text, bool defuse) {
    const bool quoted = needsQuotes(text);
    if (quoted) {
        out += '"';
    }
    if (defuse && looksLikeFormula(text)) {
        out += '\'';
    }
    for (const char c : text) {
        out.append(quoted && c == '"' ? 2 : 1, c);
    }
    if (quoted) {
        out += '"';
    }
}

}  // namespace quor::cli
