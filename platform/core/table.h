// The string table behind QLIBSZHASH: entries in the order of first insertion, found by key.
#ifndef PLATFORM_CORE_TABLE_H
#define PLATFORM_CORE_TABLE_H

#include <deque>
#include <string>
#include <string_view>
#include <unordered_map>

#include "quor/quorcore.h"

struct QLIBSZHASH_tag {
    struct Entry {
        std::string key;
        std::string value;
    };

    QLIBSZHASH_tag() = default;
    QLIBSZHASH_tag(const QLIBSZHASH_tag&) = delete;  // the index points into the entries
    QLIBSZHASH_tag& operator=(const QLIBSZHASH_tag&) = delete;

    void set(std::string_view key, std::string_view value) {
        const auto found = index_.find(key);
        if (found != index_.end()) {
            found->second->value = value;
            return;
        }
        Entry& added = entries_.emplace_back(Entry{std::string(key), std::string(value)});
        index_.emplace(added.key, &added);
    }

    const Entry* find(std::string_view key) const {
        const auto found = index_.find(key);
        return found != index_.end() ? found->second : nullptr;
    }

    const std::deque<Entry>& entries() const { return entries_; }

  private:
    std::deque<Entry> entries_;  // a deque: entries do not move when others are added
    std::unordered_map<std::string_view, Entry*> index_;
};

#endif
