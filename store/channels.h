// Whether a notice can reach somebody.
#ifndef STORE_CHANNELS_H
#define STORE_CHANNELS_H

namespace quor::store {

// Whether mail, a push service, a webhook, a command or the desktop is set up.
bool IsChannelSet();

}  // namespace quor::store

#endif
