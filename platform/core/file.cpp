#include <unistd.h>

#include "quor/quorcore.h"

int QLIBCFileExist(const char* path) {
    return path != nullptr && access(path, F_OK) == 0 ? 1 : 0;
}
