#include "platform/core/table.h"

#include "base/guarded.h"

QLIBSZHASH* QLIBCSzHashAlloc(int size) {
    return quor::Guarded<QLIBSZHASH*>(nullptr, [size] { return size < 1 ? nullptr : new QLIBSZHASH; });
}

int QLIBCSzHashSetValue(QLIBSZHASH** hash, const char* key, const char* value) {
    if (quor::AnyNull(hash, key, value) || *hash == nullptr) {
        return -1;
    }
    return quor::Guarded([&] {
        (*hash)->set(key, value);
        return 0;
    });
}

const char* QLIBCSzHashGetValue(QLIBSZHASH* hash, const char* key) {
    if (quor::AnyNull(hash, key)) {
        return nullptr;
    }
    const QLIBSZHASH::Entry* found = hash->find(key);
    return found != nullptr ? found->value.c_str() : nullptr;
}

void QLIBCSzHashFree(QLIBSZHASH* hash) {
    delete hash;
}
