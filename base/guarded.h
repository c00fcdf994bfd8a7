// What stands between a C interface and the code behind it: no null pointer gets in, and no exception out.
#ifndef BASE_GUARDED_H
#define BASE_GUARDED_H

#include <exception>

namespace quor {

template <typename... Pointers>
bool AnyNull(const Pointers*... pointers) {
    return ((pointers == nullptr) || ...);
}

// An allocation that fails gives the operation's failure value.
template <typename Result, typename Body>
Result Guarded(Result failure, const Body& body) noexcept {
    try {
        return body();
    } catch (const std::exception&) {
        return failure;
    }
}

// The same for an operation whose result is negative on failure.
template <typename Body>
int Guarded(const Body& body) noexcept {
    return Guarded(-1, body);
}

}  // namespace quor

#endif
