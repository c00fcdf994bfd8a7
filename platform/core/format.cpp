#include <cstdarg>
#include <cstdio>
#include <cstdlib>

#include "quor/quorcore.h"

char* QLIBCStrGet(const char* format, ...) {
    char* text = nullptr;
    int length = -1;
    if (format != nullptr) {
        va_list arguments;
        va_start(arguments, format);
        length = vasprintf(&text, format, arguments);
        va_end(arguments);
    }
    if (length < 0) {
        text = static_cast<char*>(calloc(1, 1));  // what cannot be formatted is empty
    }
    if (text == nullptr) {
        abort();  // the result is never null
    }
    return text;
}

void QLIBCStrPut(char* text) {
    free(text);
}
