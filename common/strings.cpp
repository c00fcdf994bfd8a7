#include "base/numbers.h"
#include "common.h"

std::string ullNumberToString(unsigned long long value) {
    return quor::Decimal(value);
}

std::list<std::string> Tokenize(const std::string& text, const std::string& delimiters) {
    std::list<std::string> fields;
    if (text.empty()) {
        return fields;
    }
    size_t pos = 0;
    for (size_t end = text.find_first_of(delimiters); end != std::string::npos;
         end = text.find_first_of(delimiters, pos)) {
        fields.push_back(text.substr(pos, end - pos));
        pos = end + 1;
    }
    fields.push_back(text.substr(pos));
    return fields;
}

int EncodeJson(const char* in, char* out, int outSize) {
    if (in == nullptr || out == nullptr || in == out) {
        return -1;
    }
    int used = 0;
    for (; *in != '\0'; ++in) {
        const bool escaped = *in == '"' || *in == '\\';
        const int width = escaped ? 2 : 1;
        if (width > outSize - used) {
            return -1;
        }
        if (escaped) {
            out[used] = '\\';
        }
        out[used + width - 1] = *in;
        used += width;
    }
    if (used >= outSize) {
        return -1;
    }
    out[used] = '\0';
    return 0;
}
