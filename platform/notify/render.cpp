#include "platform/notify/render.h"

#include <cstring>
#include <string_view>

#include "base/guards.h"
#include "platform/notify/oneline.h"

namespace quor::notify {
namespace {

constexpr size_t kTemplateBytes = 65536;
constexpr size_t kBodyBytes = 65536;
constexpr size_t kSubjectBytes = 240;
constexpr std::string_view kEscapedPlaceholder = "%SYSLOG_CONTENT%";

// A tag names a file, so nothing in it may lead elsewhere.
bool isPlainName(const std::string& tag) {
    constexpr const char kNameCharacters[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-";
    return !tag.empty() && tag.size() <= 64 && tag.find_first_not_of(kNameCharacters) == std::string::npos;
}

std::string readTemplate(const std::string& path) {
    const File file(fopen(path.c_str(), "rbe"));
    if (!file) {
        return "";
    }
    std::string text(kTemplateBytes, '\0');
    text.resize(fread(text.data(), 1, text.size(), file.get()));
    text.resize(strlen(text.c_str()));
    return text;
}

// Takes the first line off `text`.
std::string_view nextLine(std::string_view& text) {
    const size_t end = text.find('\n');
    std::string_view line = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    if (!line.empty() && line.back() == '\r') {
        line.remove_suffix(1);
    }
    return line;
}

// The callers escape log content for JSON; a reader wants it as it was received.
std::string unescaped(const char* text) {
    std::string plain;
    for (; *text != '\0'; ++text) {
        if (*text == '\\' && (text[1] == '"' || text[1] == '\\')) {
            ++text;
        }
        plain += *text;
    }
    return plain;
}

// The placeholder that `text` begins with, percent signs included; empty when there is none.
std::string_view placeholderAt(std::string_view text) {
    constexpr const char kNameCharacters[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_";
    const size_t end = text.find_first_not_of(kNameCharacters, 1);
    const bool named = text.front() == '%' && end != std::string_view::npos && end > 1 && text[end] == '%';
    return named ? text.substr(0, end + 1) : std::string_view();
}

struct Expanded {
    std::string text;
    bool complete = true;  // every placeholder had a value
};

// Values are put in as they are, never looked at again: a placeholder inside one stays text.
Expanded expand(std::string_view line, QLIBSZHASH* values) {
    Expanded result;
    while (!line.empty()) {
        const std::string_view name = placeholderAt(line);
        if (name.empty()) {
            result.text += line.front();
            line.remove_prefix(1);
            continue;
        }
        const char* value = QLIBCSzHashGetValue(values, std::string(name).c_str());
        if (value == nullptr) {
            result.complete = false;
        } else {
            result.text += name == kEscapedPlaceholder ? unescaped(value) : value;
        }
        line.remove_prefix(name.size());
    }
    return result;
}

// A line that names something this notice does not have, such as the host, is left out.
std::string expandBody(std::string_view text, QLIBSZHASH* values) {
    std::string body;
    while (!text.empty() && body.size() < kBodyBytes) {
        const Expanded line = expand(nextLine(text), values);
        if (line.complete) {
            body.append(line.text, 0, kBodyBytes - body.size()).append("\n");
        }
    }
    return body;
}

std::string valueOf(QLIBSZHASH* values, const char* key) {
    const char* value = QLIBCSzHashGetValue(values, key);
    return value != nullptr ? value : "";
}

}  // namespace

std::optional<Notice> Render(const std::string& tag, const std::string& textsDir, QLIBSZHASH* values) {
    if (!isPlainName(tag)) {
        return std::nullopt;
    }
    const std::string source = readTemplate(textsDir + "/" + tag + ".txt");
    std::string_view text = source;
    const std::string_view subject = nextLine(text);
    if (subject.find_first_not_of(" \t") == std::string_view::npos) {
        return std::nullopt;
    }
    if (std::string_view rest = text; nextLine(rest).empty()) {
        text = rest;
    }
    Notice notice;
    notice.tag = tag;
    notice.className = OneLine(valueOf(values, "DESKTOP_NOTIFY_CLASSNAME"), kSubjectBytes);
    notice.host = valueOf(values, "%HOST%").substr(0, kSubjectBytes);
    notice.subject = OneLine(expand(subject, values).text, kSubjectBytes);
    notice.body = expandBody(text, values);
    return notice;
}

}  // namespace quor::notify
