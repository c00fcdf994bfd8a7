// The definition behind the one of this program.
#ifndef TESTS_SUPPORT_REAL_H
#define TESTS_SUPPORT_REAL_H

#include <dlfcn.h>

namespace quor::test {

template <typename Function>
Function* Real(Function* /*type*/, const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

}  // namespace quor::test

#endif
