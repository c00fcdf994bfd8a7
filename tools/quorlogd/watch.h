// Tells when a database may have changed.
#ifndef QUORLOGD_WATCH_H
#define QUORLOGD_WATCH_H

#include <string>

#include "base/guards.h"

namespace quor {

// Watches the folder of a file, which may come, go and be replaced. Where that cannot be done there is never a sign:
// look once a second.
class FolderWatch {
  public:
    explicit FolderWatch(const std::string& file);

    // Readable as soon as something has changed; -1 when nothing can be watched.
    int descriptor() const { return signs_.get(); }
    // Forgets the signs so far.
    void clear() const;

  private:
    Descriptor signs_;
};

}  // namespace quor

#endif
