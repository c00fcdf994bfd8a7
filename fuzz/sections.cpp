// Section files of any content are read and written without harm; what was written is read back.
#include "common/handles.h"
#include "fuzz/fuzz.h"
#include "notification.h"

using quor::fuzz::Require;

namespace {

bool isPlain(const std::string& text) {
    for (const char c : text) {
        if (c < '!' || c > '~' || c == '[' || c == ']' || c == '"' || c == '=' || c == '#' || c == ';') {
            return false;
        }
    }
    return !text.empty();
}

void readAll(const char* path) {
    quor::StringList names;
    if (QLIBCFileEnumSection(path, quor::Adopt(names)) < 0 || names == nullptr) {
        return;
    }
    for (int i = 0; i < names->count; ++i) {
        quor::StringTable table(QLIBCSzHashAlloc(8));
        if (QLIBCFileGetSection(path, names->items[i], quor::Adopt(table)) >= 0) {
            (void)QLIBCSzHashGetValue(table.get(), "threshold");
        }
    }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* bytes, size_t size) {
    FuzzedDataProvider data(bytes, size);
    const std::string section = data.ConsumeRandomLengthString(24);
    const std::string value = data.ConsumeRandomLengthString(40);
    const std::string path = quor::fuzz::ScratchPath("sections.conf");
    const std::string content = data.ConsumeRemainingBytesAsString();
    quor::fuzz::WriteFile(path, content);

    readAll(path.c_str());
    char text[16];
    (void)QLIBCFileGetKeyValue(path.c_str(), "mail", text, sizeof text, 0);

    quor::StringTable table(QLIBCSzHashAlloc(8));
    QLIBSZHASH* raw = table.get();
    Require(QLIBCSzHashSetValue(&raw, "key", value.c_str()) >= 0, "a value can be set");
    (void)table.release();
    table.reset(raw);
    const int written = QLIBCFileSetSection(path.c_str(), section.c_str(), section.c_str(), table.get(), "%s=\"%s\"\n");
    if (isPlain(section) && isPlain(value) && content.find('\0') == std::string::npos) {
        Require(written >= 0, "a plain section is written");
        quor::StringTable back(QLIBCSzHashAlloc(8));
        Require(QLIBCFileGetSection(path.c_str(), section.c_str(), quor::Adopt(back)) >= 0, "and read");
        const char* read = QLIBCSzHashGetValue(back.get(), "key");
        Require(read != nullptr && value == read, "with the same value");
    }
    readAll(path.c_str());
    return 0;
}
