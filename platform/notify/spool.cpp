#include "platform/notify/spool.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <tuple>

#include "base/files.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "quor/quorfs.h"

namespace quor::notify {
namespace {

// For each channel.
constexpr size_t kMostQueued = 200;
constexpr int kMostWorkers = 2;

constexpr size_t kMostNoticeBytes = 131072;
constexpr size_t kFieldCount = 8;
constexpr off_t kMostGivenUpBytes = 262144;

// Within 16 hours: a server that is down overnight is worth waiting for.
constexpr unsigned kMostTries = 16;
constexpr int64_t kFirstWait = 30;
constexpr int64_t kLongestWait = 7200;

// The name of a queued file is its number and how often it was tried; its time is that of the last try.
constexpr size_t kNameDigits = 20;
constexpr size_t kTriesDigits = 2;

std::string below(const std::string& name) {
    return std::string(paths::kNotifySpool) + "/" + name;
}

constexpr const char kGivenUp[] = "given-up";

std::string queueFolder(const char* channel) {
    return below("queue/") + channel;
}

std::string padded(uint64_t number, size_t digits) {
    const std::string text = std::to_string(number);
    return std::string(digits - text.size(), '0') + text;
}

Descriptor openOwn(const std::string& path, int flags) {
    return Descriptor(open(path.c_str(), flags | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
}

struct Queued {
    uint64_t number;
    unsigned tries;

    std::string name() const { return padded(number, kNameDigits) + "." + padded(tries, kTriesDigits); }
};

std::optional<Queued> queuedAs(const std::string& name) {
    const bool ours = name.size() == kNameDigits + 1 + kTriesDigits && name[kNameDigits] == '.' &&
                      name.find_first_not_of("0123456789.") == std::string::npos;
    return ours ? std::optional(Queued{ToUint64(name.substr(0, kNameDigits).c_str()),
                                       static_cast<unsigned>(ToUint64(name.substr(kNameDigits + 1).c_str()))})
                : std::nullopt;
}

// What waits, the least tried and oldest first; foreign files are left alone.
std::vector<Queued> queued(const char* channel) {
    std::vector<Queued> waiting;
    std::error_code error;
    for (std::filesystem::directory_iterator entry(queueFolder(channel), error), end; entry != end && !error;
         entry.increment(error)) {
        if (const std::optional<Queued> found = queuedAs(entry->path().filename())) {
            waiting.push_back(*found);
        }
    }
    std::sort(waiting.begin(), waiting.end(), [](const Queued& a, const Queued& b) {
        return std::tie(a.tries, a.number) < std::tie(b.tries, b.number);
    });
    return waiting;
}

// Each wait is twice as long as the one before. A clock that was set back makes a notice due.
bool isDue(const std::string& path, unsigned tries, int64_t now) {
    struct stat last {};
    if (tries == 0 || stat(path.c_str(), &last) != 0) {
        return tries == 0;
    }
    const int64_t wait = std::min(kFirstWait << std::min(tries - 1, kMostTries), kLongestWait);
    return now < last.st_mtime || now - last.st_mtime >= wait;
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
                                                      notice.target};
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
                  fields[7]};
}

std::string readWhole(const Descriptor& file) {
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

// Nothing when a worker has it.
Descriptor openQueued(const std::string& path) {
    Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NOFOLLOW | O_NONBLOCK));
    return file && lock(file, 0) ? std::move(file) : Descriptor();
}

}  // namespace

bool Delivery::isLast() const {
    return tries >= kMostTries;
}

void Delivery::remove() const {
    (void)unlink(path.c_str());  // what cannot be removed is tried again
}

Spool::Spool(int waitMs) {
    if (QUORFSMkdirP(paths::kNotifySpool, 0, 0, -1, -1, 0700) < 0) {
        return;
    }
    Descriptor ledger = openOwn(below("ledger"), O_RDWR);
    if (ledger && lock(ledger, waitMs)) {
        ledger_ = std::move(ledger);
    }
}

bool Spool::full(const char* channel) const {
    const std::vector<Queued> waiting = queued(channel);
    return waiting.size() >= kMostQueued && waiting.back().tries == 0;
}

// What failed most often gives way, unless it is being delivered.
void Spool::makeRoom(const char* channel) const {
    const std::vector<Queued> waiting = queued(channel);
    for (auto worst = waiting.rbegin(); worst != waiting.rend() && worst->tries != 0; ++worst) {
        const std::string path = queueFolder(channel) + "/" + worst->name();
        const Descriptor file = openQueued(path);
        if (file && unlink(path.c_str()) == 0) {
            giveUp(channel, parsed(readWhole(file)).value_or(Notice()), "newer notices took its place");
            return;
        }
    }
}

// Written beside and renamed: a worker never sees half a notice.
bool Spool::put(const char* channel, const Notice& notice) const {
    const std::vector<Queued> waiting = queued(channel);
    if (waiting.size() >= kMostQueued) {
        makeRoom(channel);
    }
    uint64_t last = 0;
    for (const Queued& before : waiting) {
        last = std::max(last, before.number);
    }
    const std::string path = queueFolder(channel) + "/" + Queued{last + 1, 0}.name();
    const std::string unfinished = below("unfinished");
    const std::string text = serialised(notice);
    const Descriptor file = openOwn(unfinished, O_WRONLY | O_TRUNC);
    return QUORFSMkdirP(queueFolder(channel).c_str(), 0, 0, -1, -1, 0700) >= 0 && file && WriteAll(file.get(), text) &&
           rename(unfinished.c_str(), path.c_str()) == 0;
}

// The try is counted before it is made, so that a crash while a notice is delivered cannot repeat forever.
std::optional<Delivery> Spool::take(const char* channel, int64_t now) const {
    const timespec stamps[] = {{static_cast<time_t>(now), 0}, {static_cast<time_t>(now), 0}};
    for (const Queued& waiting : queued(channel)) {
        const std::string path = queueFolder(channel) + "/" + waiting.name();
        const Queued tried{waiting.number, waiting.tries + 1};
        const std::string next = queueFolder(channel) + "/" + tried.name();
        Descriptor file = isDue(path, waiting.tries, now) ? openQueued(path) : Descriptor();
        if (!file || rename(path.c_str(), next.c_str()) != 0 || futimens(file.get(), stamps) != 0) {
            continue;
        }
        std::optional<Notice> notice = parsed(readWhole(file));
        if (notice && tried.tries <= kMostTries) {
            return Delivery{std::move(*notice), tried.tries, next, std::move(file)};
        }
        (void)unlink(next.c_str());
        if (notice) {
            giveUp(channel, *notice, "its last delivery was broken off");
        }
    }
    return std::nullopt;
}

bool Spool::isAnyDue(const char* channel, int64_t now) const {
    const std::vector<Queued> waiting = queued(channel);
    return std::any_of(waiting.begin(), waiting.end(), [&](const Queued& notice) {
        return isDue(queueFolder(channel) + "/" + notice.name(), notice.tries, now);
    });
}

Descriptor Spool::freeSlot(const char* channel) const {
    for (int i = 0; i < kMostWorkers; ++i) {
        Descriptor slot = openOwn(below("worker-") + channel + std::to_string(i), O_RDWR);
        if (slot && lock(slot, 0)) {
            return slot;
        }
    }
    return Descriptor();
}

// One a line; when nobody asks for them, the file grows to its bound.
void Spool::giveUp(const char* channel, const Notice& notice, const std::string& cause) const {
    const Descriptor file = openOwn(below(kGivenUp), O_WRONLY | O_APPEND);
    struct stat found {};
    if (file && fstat(file.get(), &found) == 0 && found.st_size < kMostGivenUpBytes) {
        (void)WriteAll(file.get(), channel + ("\t" + notice.subject + "\t") + cause + "\n");
    }
}

int TakeGivenUp(int waitMs, const GivenUpHandler& handler) {
    const std::string taken = below("given-up.taken");
    if (access(taken.c_str(), F_OK) != 0) {
        const Spool spool(waitMs);
        if (!spool) {
            return -1;
        }
        (void)rename(below(kGivenUp).c_str(), taken.c_str());  // mostly there is none
    }
    std::ifstream lines(taken);
    int count = 0;
    for (std::string channel, subject, cause;
         std::getline(std::getline(std::getline(lines, channel, '\t'), subject, '\t'), cause); ++count) {
        handler(channel.c_str(), subject.c_str(), cause.c_str());
    }
    (void)unlink(taken.c_str());
    return count;
}

}  // namespace quor::notify
