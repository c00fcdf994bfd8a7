#include <cstdlib>

#include "quor/quorcore.h"

QLIBSZLIST* QLIBCSzListAlloc(int size) {
    if (size < 1) {
        return nullptr;
    }
    auto* list = static_cast<QLIBSZLIST*>(calloc(1, sizeof(QLIBSZLIST)));
    if (list == nullptr) {
        return nullptr;
    }
    list->items = static_cast<char**>(calloc(static_cast<size_t>(size), sizeof(char*)));
    if (list->items == nullptr) {
        free(list);
        return nullptr;
    }
    return list;
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
