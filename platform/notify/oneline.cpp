#include "platform/notify/oneline.h"

#include "base/utf8.h"

namespace quor::notify {
namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";  // U+FFFD

std::string_view shown(std::string_view text, const Symbol& symbol, size_t at) {
    if (symbol.code < 0x20 || symbol.code == 0x7F) {
        return " ";
    }
    return symbol.valid ? text.substr(at, symbol.length) : kReplacement;
}

}  // namespace

std::string OneLine(std::string_view text, size_t size) {
    std::string line;
    for (size_t at = 0; at < text.size();) {
        const Symbol symbol = NextSymbol(text, at);
        const std::string_view next = shown(text, symbol, at);
        if (line.size() + next.size() > size) {
            break;
        }
        line += next;
        at += symbol.length;
    }
    return line;
}

}  // namespace quor::notify
