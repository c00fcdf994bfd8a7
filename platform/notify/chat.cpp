#include "platform/notify/chat.h"

#include <algorithm>
#include <array>
#include <cstdint>

#include "base/json.h"
#include "base/utf8.h"
#include "platform/notify/message.h"

namespace quor::notify {
namespace {

constexpr std::array<ChatForm, 2> kForms{{{"text", 4000}, {"content", 2000}}};
constexpr std::string_view kBegin = "```\n";
constexpr std::string_view kEnd = "\n```";
constexpr std::string_view kCut = " [...]";
constexpr std::string_view kReplacement = "\xEF\xBF\xBD";  // U+FFFD

// Services escape each in its own way, and one's escape is another's text. These look alike and mean nothing to any.
struct StandIn {
    std::string_view text;
    std::string_view shown;
};
constexpr StandIn kStandIns[] = {
    {"@", "\xEF\xBC\xA0"}, {"<", "\xE2\x80\xB9"}, {">", "\xE2\x80\xBA"}, {"`", "\xCB\x8B"}, {"://", "\xEF\xBC\x9A//"},
};

// Those that hide or turn around what stands beside them.
bool isInvisible(char32_t code) {
    constexpr std::pair<char32_t, char32_t> kRanges[] = {{0x80, 0x9F},     {0xAD, 0xAD},      {0x61C, 0x61C},
                                                         {0x200B, 0x200F}, {0x2028, 0x202E},  {0x2060, 0x206F},
                                                         {0xFEFF, 0xFEFF}, {0xE0000, 0xE0FFF}};
    return std::any_of(std::begin(kRanges), std::end(kRanges),
                       [code](const auto& range) { return code >= range.first && code <= range.second; });
}

// The next piece of `text`, as it may be shown, and the bytes that it stands for.
struct Piece {
    std::string_view shown;
    size_t length;
};

Piece nextPiece(std::string_view text) {
    const Symbol symbol = NextSymbol(text, 0);
    for (const StandIn& known : kStandIns) {
        if (text.substr(0, known.text.size()) == known.text) {
            return {known.shown, known.text.size()};
        }
    }
    if ((symbol.code < 0x20 && symbol.code != '\n') || symbol.code == 0x7F) {
        return {" ", 1};
    }
    const bool plain = symbol.valid && !isInvisible(symbol.code);
    return {plain ? text.substr(0, symbol.length) : kReplacement, symbol.length};
}

// Of valid UTF-8: every sequence of four bytes is a pair of units, and any other character is one.
size_t unitsOf(std::string_view text) {
    return static_cast<size_t>(std::count_if(text.begin(), text.end(), [](char c) { return (c & 0xC0) != 0x80; }) +
                               std::count_if(text.begin(), text.end(), [](char c) { return (c & 0xF8) == 0xF0; }));
}

std::string harmless(std::string_view text, size_t room) {
    std::string shown;
    while (!text.empty()) {
        const Piece piece = nextPiece(text);
        const size_t units = unitsOf(piece.shown);
        if (units > room) {
            return shown.append(kCut);
        }
        room -= units;
        shown += piece.shown;
        text.remove_prefix(piece.length);
    }
    return shown;
}

}  // namespace

const ChatForm* FindChatForm(std::string_view field) {
    const auto* const found =
        std::find_if(kForms.begin(), kForms.end(), [field](const ChatForm& form) { return form.field == field; });
    return found != kForms.end() ? found : nullptr;
}

std::string NoticeAsChat(const Notice& notice, const ChatForm& form) {
    const std::string held = HeldBackLine(notice);
    const size_t frame = kBegin.size() + kCut.size() + held.size() + kEnd.size();
    std::string text = notice.subject + "\n\n" + notice.body;
    text.erase(text.find_last_not_of('\n') + 1);
    text = std::string(kBegin).append(harmless(text, form.units - frame)).append(held).append(kEnd);
    return "{" + JsonString(form.field) + ":" + JsonString(text) + "}";
}

}  // namespace quor::notify
