#include "tools/quorlogd/deliveries.h"

#include <syslog.h>

#include <cstdint>
#include <map>
#include <string>
#include <utility>

#include "base/numbers.h"
#include "quor/quornotify.h"
#include "tools/quorlogd/announce.h"

namespace quor {
namespace {

struct GivenUp {
    uint64_t count = 0;
    std::string lastSubject;
};
using Failures = std::map<std::pair<std::string, std::string>, GivenUp>;  // by channel and cause

void collect(const char* channel, const char* subject, const char* cause, void* context) {
    GivenUp& entry = (*static_cast<Failures*>(context))[{channel, cause}];
    ++entry.count;
    entry.lastSubject = subject;
}

}  // namespace

void ResumeDeliveries() {
    if (QUORNotifyResume() < 0) {
        syslog(LOG_WARNING, "Cannot go on with the delivery of notices; see that the spool can be written");
    }
}

void RecordGivenUp() {
    Failures failures;
    (void)QUORNotifyGivenUp(collect, &failures);  // what it cannot tell now, it tells the next time
    for (const auto& [where, what] : failures) {
        RecordEvent("[" + Decimal(what.count) + "] notices could not be delivered by " + where.first + ": " +
                    where.second + ". The last: " + what.lastSubject);
    }
}

}  // namespace quor
