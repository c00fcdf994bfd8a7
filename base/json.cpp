#include "base/json.h"

#include <algorithm>

#include "base/utf8.h"

namespace quor {
namespace {

bool isPlain(char c) {
    return c >= 0x20 && c < 0x7F && c != '"' && c != '\\';
}

void appendUnit(std::string& out, uint32_t unit) {
    out += "\\u";
    AppendHex(out, unit, 4);
}

void appendEscape(std::string& out, char32_t code) {
    constexpr std::string_view kShort = "\"\\\n\t\r";
    constexpr std::string_view kLetters = "\"\\ntr";
    const size_t known = code < 0x80 ? kShort.find(static_cast<char>(code)) : std::string_view::npos;
    if (known != std::string_view::npos) {
        out += {'\\', kLetters[known]};
    } else if (code <= 0xFFFF) {
        appendUnit(out, code);
    } else {
        appendUnit(out, 0xD7C0 + (code >> 10U));
        appendUnit(out, 0xDC00 + (code & 0x3FFU));
    }
}

}  // namespace

void AppendHex(std::string& out, uint32_t value, int digits) {
    constexpr char kDigits[] = "0123456789abcdef";
    for (int shift = 4 * (digits - 1); shift >= 0; shift -= 4) {
        out += kDigits[(value >> static_cast<unsigned>(shift)) & 0xFU];
    }
}

void AppendJsonString(std::string& out, std::string_view text, bool (*isHidden)(char32_t code)) {
    out += '"';
    for (size_t at = 0; at < text.size();) {
        const auto* const begin = text.begin() + at;
        const auto run = static_cast<size_t>(std::find_if_not(begin, text.end(), isPlain) - begin);
        out.append(text, at, run);
        at += run;
        if (at == text.size()) {
            break;
        }
        const Symbol symbol = NextSymbol(text, at);
        if (!symbol.valid) {
            out += "\\\\x";  // the backslash of \xNN is itself escaped
            AppendHex(out, symbol.code, 2);
        } else if (symbol.code < 0x80 || (isHidden != nullptr && isHidden(symbol.code))) {
            appendEscape(out, symbol.code);
        } else {
            out.append(text, at, symbol.length);
        }
        at += symbol.length;
    }
    out += '"';
}

std::string JsonString(std::string_view text) {
    std::string json;
    AppendJsonString(json, text);
    return json;
}

}  // namespace quor
