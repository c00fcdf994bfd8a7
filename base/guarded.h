// No exception leaves a C interface: an allocation that fails gives the operation's failure value.
#ifndef BASE_GUARDED_H
#define BASE_GUARDED_H

#include <exception>

namespace quor {

template <typename Result, typename Body>
Result Guarded(Result failure, const Body& body) noexcept {
    try {
        return body();
    } catch (const std::exception&) {
        return failure;
    }
}

}  // namespace quor

#endif
