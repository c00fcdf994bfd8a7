// Why a question has no answer.
#ifndef STORE_WHYNOTHING_H
#define STORE_WHYNOTHING_H

#include <string>

#include "store/selection.h"

namespace quor::store {

// The reason in words, as far as it shows without reading every message. `options` are what the selection's
// filter was built from; `below` is the id that rows had to stay below, or 0.
std::string WhyNothing(const Source& source, const Selection& selection, const FilterOptions& options, uint64_t below);

}  // namespace quor::store

#endif
