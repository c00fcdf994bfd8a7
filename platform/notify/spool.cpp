#include "platform/notify/spool.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <filesystem>
#include <string>
#include <vector>

#include "base/files.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "quor/quorfs.h"

namespace quor::notify {
namespace {

constexpr size_t kMostQueued = 200;
constexpr int kMostWorkers = 3;
constexpr size_t kMostNoticeBytes = 131072;
constexpr size_t kNameDigits = 20;
constexpr size_t kFieldCount = 8;

std::string below(const std::string& name) {
    return std::string(paths::kNotifySpool) + "/" + name;
}

std::string queueFolder() {
    return below("queue");
}

std::string queueFile(const std::string& name) {
    return queueFolder() + "/" + name;
}

std::string nameAfter(const std::vector<std::string>& names) {
    const std::string number = std::to_string(names.empty() ? 1 : ToUint64(names.back().c_str()) + 1);
    return std::string(kNameDigits - number.size(), '0') + number;
}

Descriptor openOwn(const std::string& path, int flags) {
    return Descriptor(open(path.c_str(), flags | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
}

// The names of the queued files, oldest first; foreign files are left alone.
std::vector<std::string> queued() {
    std::vector<std::string> names;
    std::error_code error;
    for (std::filesystem::directory_iterator entry(queueFolder(), error), end; entry != end && !error;
         entry.increment(error)) {
        std::string name = entry->path().filename();
        if (name.size() == kNameDigits && name.find_first_not_of("0123456789") == std::string::npos) {
            names.push_back(std::move(name));
        }
    }
    std::sort(names.begin(), names.end());
    return names;
}

// No field can hold a zero byte, so one ends each.
std::string serialised(const Notice& notice) {
    const std::array<std::string, kFieldCount> fields{notice.tag,
                                                      notice.className,
                                                      notice.host,
                                                      notice.subject,
                                                      notice.body,
                                                      std::to_string(notice.time),
                                                      std::to_string(notice.heldBack),
                                                      std::to_string(notice.channels)};
    std::string text;
    for (const std::string& field : fields) {
        text.append(field).push_back('\0');
    }
    return text;
}

std::optional<Notice> parsed(const std::string& text) {
    std::array<std::string, kFieldCount> fields;
    size_t pos = 0;
    for (std::string& field : fields) {
        const size_t end = text.find('\0', pos);
        if (end == std::string::npos) {
            return std::nullopt;
        }
        field = text.substr(pos, end - pos);
        pos = end + 1;
    }
    return Notice{fields[0],
                  fields[1],
                  fields[2],
                  fields[3],
                  fields[4],
                  ToInt64(fields[5].c_str()),
                  static_cast<uint32_t>(ToUint64(fields[6].c_str())),
                  static_cast<uint32_t>(ToUint64(fields[7].c_str()))};
}

std::string readNotice(const std::string& path) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    std::string text(kMostNoticeBytes, '\0');
    text.resize(ReadAt(file, 0, text.data(), text.size()));
    return text;
}

bool lock(const Descriptor& file, int waitMs) {
    if (waitMs == kWaitForever) {
        return flock(file.get(), LOCK_EX) == 0;
    }
    while (flock(file.get(), LOCK_EX | LOCK_NB) != 0) {
        if (waitMs-- <= 0) {
            return false;
        }
        (void)usleep(1000);
    }
    return true;
}

}  // namespace

Spool::Spool(int waitMs) {
    if (QUORFSMkdirP(queueFolder().c_str(), 0, 0, -1, -1, 0700) < 0) {
        return;
    }
    Descriptor ledger = openOwn(below("ledger"), O_RDWR);
    if (ledger && lock(ledger, waitMs)) {
        ledger_ = std::move(ledger);
    }
}

bool Spool::full() const {
    return queued().size() >= kMostQueued;
}

// Written beside and renamed: a worker never sees half a notice.
bool Spool::put(const Notice& notice) const {
    const std::string path = queueFile(nameAfter(queued()));
    const std::string unfinished = below("unfinished");
    const std::string text = serialised(notice);
    const Descriptor file = openOwn(unfinished, O_WRONLY | O_TRUNC);
    return file && WriteAll(file, text) && rename(unfinished.c_str(), path.c_str()) == 0;
}

std::optional<Notice> Spool::take() const {
    for (const std::string& name : queued()) {
        const std::string path = queueFile(name);
        std::optional<Notice> notice = parsed(readNotice(path));
        if (unlink(path.c_str()) == 0 && notice) {
            return notice;
        }
    }
    return std::nullopt;
}

Descriptor Spool::freeSlot() const {
    for (int i = 0; i < kMostWorkers; ++i) {
        Descriptor slot = openOwn(below("worker" + std::to_string(i)), O_RDWR);
        if (slot && lock(slot, 0)) {
            return slot;
        }
    }
    return Descriptor();
}

}  // namespace quor::notify
