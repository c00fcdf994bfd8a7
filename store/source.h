// Where log rows are kept, and the few questions that every such place answers. What is made of the answers (pages,
// rows as they arrive, why nothing was found) is the same for all of them: selection.h, follower.h, whynothing.h.
#ifndef STORE_SOURCE_H
#define STORE_SOURCE_H

#include <cstdint>
#include <functional>
#include <list>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "store/filter.h"
#include "store/record.h"

namespace quor::store {

using RecordHandler = std::function<void(const Record&)>;
using GroupHandler = std::function<void(std::string_view name, uint64_t rows)>;

struct Window {
    uint64_t limit = 0;  // 0: no limit
    uint64_t offset = 0;
};

// The ids from `first` to `last`.
struct IdRange {
    uint64_t first;
    uint64_t last;
};

// Every question is answered from the state of that moment. One that cannot be answered throws a Failure.
class Source {
  public:
    Source() = default;
    Source(const Source&) = delete;
    Source& operator=(const Source&) = delete;
    virtual ~Source() = default;

    // Hands over the rows that meet all conditions, in the order of their ids, and returns their number. They are all
    // held in memory at once. Of limit and offset the low 32 bits count.
    virtual uint64_t read(const std::string& table, const Conditions& conditions, const Window& window, bool ascending,
                          const RecordHandler& handler) const = 0;
    // Counts the rows that meet all conditions.
    virtual uint64_t count(const std::string& table, const Conditions& conditions) const = 0;
    // Counts them by the value of an SQL expression of ours, in no order; null counts as the empty text.
    virtual void groups(const std::string& table, const Conditions& conditions, const std::string& expression,
                        const GroupHandler& handler) const = 0;
    // The distinct values of an attribute of table logs, ascending. Of limit and offset the low 32 bits count.
    virtual std::list<std::string> values(_SYSLOG_DB_ATTRI_tag attribute, const Window& window) const = 0;
    // Deletes the rows of table logs that meet all conditions: every row when there is none.
    virtual void remove(const Conditions& conditions) const = 0;

    // Rows of table logs that were put there from another database and not received, as far as they end behind `after`.
    virtual std::vector<IdRange> brought(uint64_t after) const = 0;

    // The name of this collection of rows: another one as soon as other rows have taken their place. Empty while there
    // is none to read.
    virtual std::string identity() const = 0;
    // What people call it.
    virtual const std::string& name() const = 0;
};

// The log database in the file `path`, which must exist.
std::unique_ptr<Source> OpenSource(const std::string& path);
// The same, for those who wait until there is one.
std::unique_ptr<Source> ExpectSource(const std::string& path);

// False for the makeshift identity of a database that bears none.
bool HasIdentity(const std::string& identity);
// Gives the log database in a file an identity unless it has one. Failure when it has no table yet.
void GiveIdentity(const std::string& path);

}  // namespace quor::store

#endif
