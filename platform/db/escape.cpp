// Text inside SQL literals and LIKE patterns.
#include <cstddef>
#include <cstring>

#include "quor/quordb.h"

namespace {

// Writes the text with `mark` before every special byte. A zero byte ends it, as it ends every SQL text.
int escape(char* out, size_t outSize, const char* in, size_t inLen, const char* specials, char mark) {
    if (out == nullptr || outSize == 0) {
        return -1;
    }
    out[0] = '\0';
    if (in == nullptr) {
        return -1;
    }
    size_t used = 0;
    for (size_t i = 0; i < inLen && in[i] != '\0'; ++i) {
        const bool special = strchr(specials, in[i]) != nullptr;
        if (used + (special ? 2 : 1) >= outSize) {
            out[0] = '\0';  // half a text would mean something else
            return -1;
        }
        if (special) {
            out[used++] = mark;
        }
        out[used++] = in[i];
    }
    out[used] = '\0';
    return 0;
}

}  // namespace

int QUORDBEscapeStringEX(DBConnect_tag* /*connection*/, char* out, unsigned int outSize, const char* in,
                         unsigned int inLen) {
    return escape(out, outSize, in, inLen, "'", '\'');
}

int QUORDBEscapeStringEX2(DBConnect_tag* connection, char* out, unsigned int outSize, const char* in,
                          unsigned int inLen) {
    return QUORDBEscapeStringEX(connection, out, outSize, in, inLen);
}

int QUORDBEscapeBackslashEX2(DBConnect_tag* /*connection*/, char* out, unsigned int outSize, const char* in) {
    return escape(out, outSize, in, in != nullptr ? strlen(in) : 0, "\\%_", '\\');
}
