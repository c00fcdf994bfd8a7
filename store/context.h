// Rows together with those around them.
#ifndef STORE_CONTEXT_H
#define STORE_CONTEXT_H

#include <cstdint>
#include <functional>

#include "store/selection.h"

namespace quor::store {

// How many rows around each one, in the order of ids; at most kMostContext.
struct Context {
    uint64_t before = 0;
    uint64_t after = 0;
};
constexpr uint64_t kMostContext = 1000;

// `hit`: the row is one of the selection. `apart`: rows were left out between it and the row handed over before.
using ContextHandler = std::function<void(const Record&, bool hit, bool apart)>;

// Hands over the rows that Select() does and those around them, which no filter, limit or offset concerns; every row
// once, in the order of the selection. Returns the number of hits.
uint64_t SelectWithContext(const Source& source, const Selection& selection, const Context& context,
                           const ContextHandler& handler);

}  // namespace quor::store

#endif
