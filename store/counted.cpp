#include "store/counted.h"

#include <vector>

#include "base/paths.h"
#include "store/ask.h"
#include "store/failure.h"
#include "store/selection.h"

namespace quor::store {

std::optional<uint64_t> CountedUpTo(const Source& source) try {
    const std::vector<std::string> found =
        Ask(paths::kAccountingDb, "SELECT last FROM followed WHERE source = " + Literal(source.identity()), "last");
    return found.empty() ? std::nullopt : std::optional(ToUint64(found.front().c_str()));
} catch (const Failure& failure) {
    if (failure.cause() != Cause::Missing) {
        throw;
    }
    return std::nullopt;  // quorlogd never ran
}

uint64_t NewestReceived(const Source& source) {
    uint64_t newest = LargestId(source, "logs");
    const std::vector<IdRange> brought = source.brought(0);
    for (auto range = brought.rbegin(); range != brought.rend(); ++range) {
        newest = range->first <= newest && newest <= range->last ? range->first - 1 : newest;
    }
    return newest;
}

}  // namespace quor::store
