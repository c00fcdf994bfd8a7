#include "text.h"

#include <cstdint>

namespace quor::cli {
namespace {

constexpr char kHexDigits[] = "0123456789abcdef";

void appendHex(std::string& out, uint32_t value, int digits) {
    for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4) {
        out += kHexDigits[(value >> static_cast<unsigned>(shift)) & 0xF];
    }
}

bool isPrintableAscii(char c) {
    return c >= 0x20 && c < 0x7F;
}

// The length of the leading part that needs no look at its symbols.
template <typename Plain>
size_t plainRun(std::string_view text, size_t at, Plain plain) {
    size_t end = at;
    while (end < text.size() && plain(text[end])) {
        ++end;
    }
    return end - at;
}

void appendByte(std::string& out, uint32_t byte) {
    out += "\\x";
    appendHex(out, byte, 2);
}

// \n, \t, \r; \xNN; \uNNNN or \UNNNNNNNN
void appendSpelled(std::string& out, char32_t code) {
    switch (code) {
    case U'\n':
        out += "\\n";
        return;
    case U'\t':
        out += "\\t";
        return;
    case U'\r':
        out += "\\r";
        return;
    default:
        break;
    }
    if (code < 0x80) {
        appendByte(out, code);
        return;
    }
    out += code <= 0xFFFF ? "\\u" : "\\U";
    appendHex(out, code, code <= 0xFFFF ? 4 : 8);
}

void appendJsonUnit(std::string& out, uint32_t unit) {
    out += "\\u";
    appendHex(out, unit, 4);
}

void appendJsonEscape(std::string& out, char32_t code) {
    if (code == U'"' || code == U'\\') {
        out += '\\';
        out += static_cast<char>(code);
    } else if (code == U'\n' || code == U'\t' || code == U'\r') {
        appendSpelled(out, code);
    } else if (code <= 0xFFFF) {
        appendJsonUnit(out, code);
    } else {
        appendJsonUnit(out, 0xD7C0 + (code >> 10));
        appendJsonUnit(out, 0xDC00 + (code & 0x3FF));
    }
}

bool isPlainInJson(char c) {
    return isPrintableAscii(c) && c != '"' && c != '\\';
}

bool looksLikeFormula(std::string_view text) {
    return !text.empty() && std::string_view("=+-@\t\r\n'").find(text.front()) != std::string_view::npos;
}

bool needsQuotes(std::string_view text) {
    return text.find_first_of(",\"\r\n") != std::string_view::npos ||
           (!text.empty() && (text.front() == ' ' || text.back() == ' '));
}

}  // namespace

size_t AppendVisible(std::string& out, std::string_view text) {
    size_t width = 0;
    for (size_t at = 0; at < text.size();) {
        const size_t run = plainRun(text, at, isPrintableAscii);
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
            width += SymbolWidth(symbol.code);
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

void AppendJsonString(std::string& out, std::string_view text) {
    out += '"';
    for (size_t at = 0; at < text.size();) {
        const size_t run = plainRun(text, at, isPlainInJson);
        out.append(text, at, run);
        at += run;
        if (at == text.size()) {
            break;
        }
        const Symbol symbol = NextSymbol(text, at);
        if (!symbol.valid) {
            out += '\\';  // the backslash of \xNN is itself escaped
            appendByte(out, symbol.code);
        } else if (symbol.code < 0x80 || IsHidden(symbol.code)) {
            appendJsonEscape(out, symbol.code);
        } else {
            out.append(text, at, symbol.length);
        }
        at += symbol.length;
    }
    out += '"';
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
