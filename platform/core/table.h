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

    void set(std::string_view key, std::string_view value) {
        const auto found = index.find(key);
        if (found != index.end()) {
            found->second->value = value;
            return;
        }
        Entry& added = entries.emplace_back(Entry{std::string(key), std::string(value)});
        index.emplace(added.key, &added);
    }

    std::deque<Entry> entries;  // a deque: entries do not move when others are added
    std::unordered_map<std::string_view, Entry*> index;
};

#endif
