// Where log rows are kept, and the few questions that every such place answers. What is made of the answers (pages,
// rows as they arrive, why nothing was found) is the same for all of them: selection.h, follower.h, whynothing.h.
#ifndef STORE_SOURCE_H
#define STORE_SOURCE_H

#include <cstdint>
#include <functional>
#include <list>
#include <memory>
#include <string>

#include "dbutil.h"
#include "store/filter.h"

namespace quor::store {

using RecordHandler = std::function<void(const _SYSLOG_LOG_DATA_tag&)>;

struct Window {
    uint64_t limit = 0;  // 0: no limit
    uint64_t offset = 0;
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
    // The distinct values of an attribute of table logs, ascending. Of limit and offset the low 32 bits count.
    virtual std::list<std::string> values(_SYSLOG_DB_ATTRI_tag attribute, const Window& window) const = 0;
    // Deletes the rows of table logs that meet all conditions: every row when there is none.
    virtual void remove(const Conditions& conditions) const = 0;

    // A number of these rows as a whole: another one as soon as others have taken their place, 0 while there are none.
    virtual uint64_t identity() const = 0;
    // What people call it.
    virtual const std::string& name() const = 0;
};

// The log database in the file `path`, which must exist.
std::unique_ptr<Source> OpenSource(const std::string& path);

}  // namespace quor::store

#endif
