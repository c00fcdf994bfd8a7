// Notices from any template and any values: what the channels get is well-formed.
#include <json/json.h>

#include <algorithm>
#include <memory>

#include "base/utf8.h"
#include "common/handles.h"
#include "fuzz/fuzz.h"
#include "platform/notify/chat.h"
#include "platform/notify/message.h"
#include "platform/notify/render.h"

using quor::fuzz::Require;

namespace {

bool isJson(const std::string& text) {
    Json::CharReaderBuilder builder;
    Json::CharReaderBuilder::strictMode(&builder.settings_);
    const std::unique_ptr<Json::CharReader> reader(builder.newCharReader());
    Json::Value value;
    std::string errors;
    return reader->parse(text.data(), text.data() + text.size(), &value, &errors);
}

bool isOneLine(const std::string& text) {
    return std::none_of(text.begin(), text.end(), [](unsigned char c) { return c < ' ' || c == 0x7f; });
}

// The header of a mail: what values hold must not add lines of its own.
size_t headerLines(const std::string& mail) {
    const std::string header = mail.substr(0, mail.find("\r\n\r\n"));
    return static_cast<size_t>(std::count(header.begin(), header.end(), '\n'));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    FuzzedDataProvider data(bytes, size);
    quor::StringTable table(QLIBCSzHashAlloc(8));
    for (const char* key : {"%HOST%", "%SYSLOG_CONTENT%", "%LEVEL%", "DESKTOP_NOTIFY_CLASSNAME"}) {
        QLIBSZHASH* raw = table.release();
        (void)QLIBCSzHashSetValue(&raw, key, data.ConsumeRandomLengthString(200).c_str());
        table.reset(raw);
    }
    quor::fuzz::WriteFile(quor::fuzz::ScratchPath("TAG.txt"),
                          data.ConsumeBool() ? "Subject %HOST% %LEVEL%\n\n%SYSLOG_CONTENT%\n%ABSENT%\n"
                                             : data.ConsumeRemainingBytesAsString());
    const std::string folder = quor::fuzz::ScratchPath("");
    const std::optional<quor::notify::Notice> notice = quor::notify::Render("TAG", folder, table.get());
    if (!notice) {
        return 0;
    }
    Require(isOneLine(notice->subject) && quor::IsUtf8(notice->subject), "the subject is one line of UTF-8");
    Require(isJson(quor::notify::NoticeAsJson(*notice)), "the JSON is valid");
    for (const char* field : {"text", "content"}) {
        const std::string chat = quor::notify::NoticeAsChat(*notice, *quor::notify::FindChatForm(field));
        Require(isJson(chat) && quor::IsUtf8(chat), "the chat message is valid");
        Require(chat.find_first_of("@<>") == std::string::npos && chat.find("://") == std::string::npos,
                "no markup of a sender is in it");
        Require(chat.find("```", chat.find("```") + 3) == chat.size() - 5, "nor does one end its block");
    }
    QUORMAIL mail{};
    snprintf(mail.recipient, sizeof mail.recipient, "a@example.org");
    quor::notify::Notice plain = *notice;
    plain.subject = "subject";
    plain.host.clear();
    plain.body.clear();
    Require(headerLines(quor::notify::NoticeAsMail(mail, *notice)) <=
                headerLines(quor::notify::NoticeAsMail(mail, plain)) + notice->subject.size() / 30 + 1,
            "only a long subject takes more header lines");
    return 0;
}
