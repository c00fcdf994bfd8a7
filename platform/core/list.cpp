#include <cstdlib>

#include "base/guards.h"
#include "quor/quorcore.h"

QLIBSZLIST* QLIBCSzListAlloc(int size) {
    if (size < 1) {
        return nullptr;
    }
    quor::Guard<QLIBSZLIST, QLIBCSzListFree> list(static_cast<QLIBSZLIST*>(calloc(1, sizeof(QLIBSZLIST))));
    if (list != nullptr) {
        list->items = static_cast<char**>(calloc(static_cast<size_t>(size), sizeof(char*)));
    }
    return list != nullptr && list->items != nullptr ? list.release() : nullptr;
}

void QLIBCSzListFree(QLIBSZLIST* list) {
    if (list == nullptr) {
        return;
    }
    for (int i = 0; i < list->count; ++i) {
        free(list->items[i]);
    }
    free(list->items);
    free(list);
}
