// Notices that could not be delivered at once. The notification service tries them again when somebody asks it to.
#ifndef QUORLOGD_DELIVERIES_H
#define QUORLOGD_DELIVERIES_H

namespace quor {

void ResumeDeliveries();
// Records an event for each channel and cause with notices that were given up since the last call.
void RecordGivenUp();

}  // namespace quor

#endif
