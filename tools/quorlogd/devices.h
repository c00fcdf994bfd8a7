// Names of devices are whatever senders claim: only so many are counted apart, the others together.
#ifndef QUORLOGD_DEVICES_H
#define QUORLOGD_DEVICES_H

#include <cstdint>
#include <list>
#include <string>
#include <string_view>
#include <unordered_map>

namespace quor {

class Devices {
  public:
    explicit Devices(size_t limit) : limit_(limit) {}

    // A name that was counted before.
    void know(const std::string& name);
    // The name under which a device at `address` is counted on this day (any number that grows by the day). An address
    // may bring only so many new names a day. When all places are taken, a name that was not heard for a day gives way.
    const std::string& admit(const std::string& name, const std::string& address, int64_t day);
    size_t count() const { return known_.size(); }

  private:
    struct Entry {
        std::string name;
        int64_t day;
    };

    void insert(const std::string& name, int64_t day);
    bool makeRoom(int64_t day);
    bool charge(const std::string& address, int64_t day);

    size_t limit_;
    std::list<Entry> recent_;  // heard last first
    std::unordered_map<std::string_view, std::list<Entry>::iterator> known_;
    std::unordered_map<std::string, unsigned> brought_;  // new names of this day, by address
    int64_t day_ = 0;
};

}  // namespace quor

#endif
