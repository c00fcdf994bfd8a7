#include "platform/notify/notify.h"

namespace quor::notify {
namespace {

constexpr std::string_view kReplacement = "\xEF\xBF\xBD";  // U+FFFD

// The well-formed sequences by their first byte; the second byte's range shuts out overlong forms and surrogates.
struct Form {
    uint8_t first;
    uint8_t last;
    uint8_t length;
    uint8_t secondFirst;
    uint8_t secondLast;
};

constexpr std::array<Form, 9> kForms{{{0x00, 0x7F, 1, 0, 0},
                                      {0xC2, 0xDF, 2, 0x80, 0xBF},
                                      {0xE0, 0xE0, 3, 0xA0, 0xBF},
                                      {0xE1, 0xEC, 3, 0x80, 0xBF},
                                      {0xED, 0xED, 3, 0x80, 0x9F},
                                      {0xEE, 0xEF, 3, 0x80, 0xBF},
                                      {0xF0, 0xF0, 4, 0x90, 0xBF},
                                      {0xF1, 0xF3, 4, 0x80, 0xBF},
                                      {0xF4, 0xF4, 4, 0x80, 0x8F}}};

uint8_t byteAt(std::string_view text, size_t pos) {
    return static_cast<uint8_t>(text[pos]);
}

bool hasForm(std::string_view text, const Form& form) {
    if (text.size() < form.length) {
        return false;
    }
    if (form.length > 1 && (byteAt(text, 1) < form.secondFirst || byteAt(text, 1) > form.secondLast)) {
        return false;
    }
    for (size_t i = 2; i < form.length; ++i) {
        if ((byteAt(text, i) & 0xC0U) != 0x80U) {
            return false;
        }
    }
    return true;
}

bool isControl(char c) {
    return static_cast<uint8_t>(c) < 0x20 || c == 0x7F;
}

std::string jsonControl(char c) {
    constexpr std::string_view kHex = "0123456789abcdef";
    switch (c) {
    case '\n':
        return "\\n";
    case '\r':
        return "\\r";
    case '\t':
        return "\\t";
    default:
        return {'\\', 'u', '0', '0', kHex[static_cast<uint8_t>(c) >> 4U], kHex[static_cast<uint8_t>(c) & 15U]};
    }
}

}  // namespace

size_t Utf8Length(std::string_view text) {
    for (const Form& form : kForms) {
        if (!text.empty() && byteAt(text, 0) >= form.first && byteAt(text, 0) <= form.last) {
            return hasForm(text, form) ? form.length : 0;
        }
    }
    return 0;
}

bool IsUtf8(std::string_view text) {
    while (!text.empty()) {
        const size_t length = Utf8Length(text);
        if (length == 0) {
            return false;
        }
        text.remove_prefix(length);
    }
    return true;
}

std::string JsonText(std::string_view text) {
    std::string json = "\"";
    while (!text.empty()) {
        const size_t length = Utf8Length(text);
        const char c = text.front();
        if (length == 0) {
            json += kReplacement;
        } else if (isControl(c)) {
            json += jsonControl(c);
        } else {
            json.append(c == '"' || c == '\\' ? 1 : 0, '\\').append(text.substr(0, length));
        }
        text.remove_prefix(length == 0 ? 1 : length);
    }
    return json + '"';
}

std::string Base64(std::string_view bytes) {
    constexpr std::string_view kDigits = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
    std::string text;
    for (; !bytes.empty(); bytes.remove_prefix(bytes.size() < 3 ? bytes.size() : 3)) {
        uint32_t group = 0;
        for (size_t i = 0; i < 3; ++i) {
            group = group << 8U | (i < bytes.size() ? byteAt(bytes, i) : 0U);
        }
        for (size_t i = 0; i < 4; ++i) {
            text += i <= bytes.size() ? kDigits[group >> (18U - 6U * i) & 63U] : '=';
        }
    }
    return text;
}

std::string OneLine(std::string_view text, size_t size) {
    std::string line;
    while (!text.empty()) {
        const size_t length = Utf8Length(text);
        std::string_view shown = length == 0 ? kReplacement : text.substr(0, length);
        if (isControl(text.front())) {
            shown = " ";
        }
        if (line.size() + shown.size() > size) {
            break;
        }
        line += shown;
        text.remove_prefix(length == 0 ? 1 : length);
    }
    return line;
}

std::vector<std::string> Words(std::string_view text, std::string_view separators) {
    std::vector<std::string> words;
    for (size_t begin = text.find_first_not_of(separators); begin != std::string_view::npos;) {
        const size_t end = text.find_first_of(separators, begin);
        words.emplace_back(text.substr(begin, end - begin));
        begin = text.find_first_not_of(separators, end);
    }
    return words;
}

}  // namespace quor::notify
