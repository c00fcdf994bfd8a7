// The notification service from the inside. The caller's process renders a notice, asks the filter, and queues it in
// the spool; a detached worker takes it from there and delivers it. Only the spool is shared between the processes, so
// all of them run as the same user.
#ifndef PLATFORM_NOTIFY_NOTIFY_H
#define PLATFORM_NOTIFY_NOTIFY_H

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "base/guards.h"
#include "quor/quornotify.h"

namespace quor::notify {

struct Notice {
    std::string tag;
    std::string className;  // the desktop application that it belongs to; may be empty
    std::string host;       // empty when the notice has none
    std::string subject;    // one line of valid UTF-8 without control characters
    std::string body;       // log content stands in it byte for byte, as it was received
    int64_t time = 0;
    uint32_t heldBack = 0;  // earlier notices that the filter or a full queue held back
    uint32_t channels = 0;  // a bit for each entry of Channels()
};

// settings.cpp

struct Settings {
    QUORMAIL mail{};
    bool mailEnabled = false;
    bool desktopEnabled = false;
    std::vector<std::string> webhookUrls;
    std::string webhookCaFile;
    bool webhookVerify = true;
    int32_t timeout = 0;  // seconds for one delivery
};

std::optional<Settings> LoadSettings();

// render.cpp

// Fills tag, class, host, subject and body. Nothing when the template is missing or has no subject.
std::optional<Notice> Render(const std::string& tag, const std::string& textsDir, QLIBSZHASH* values);

// filter.cpp

struct FilterRule {
    uint32_t channels = ~0U;
    int32_t interval = 0;  // seconds between two notices, for each host where the notice has one
};

// A file or section that is absent lets everything through.
FilterRule LoadFilterRule(const char* filterFile, const std::string& tag);

// What the ledger remembers of one tag (and host). The ledger is a file that the caller has locked.
class Interval {
  public:
    Interval(int ledger, const Notice& notice);

    // A clock that was set back makes a notice due.
    bool due(int32_t seconds, int64_t now) const;
    uint32_t heldBack() const { return record_.heldBack; }
    // Both are false when the ledger could not be written.
    bool countHeldBack();
    bool countSent(int32_t seconds, int64_t now);

  private:
    struct Record {
        char key[240];  // tag and host, filled up with zero bytes
        int64_t sent;
        uint32_t heldBack;
        uint32_t reserved;
    };

    bool store() const;

    int ledger_;
    size_t position_ = 0;
    Record record_{};
};

// spool.cpp

constexpr int kPatientlyMs = -1;

// The spool folder, locked from construction to destruction. Nothing slow is done in between.
class Spool {
  public:
    // False when the folder cannot be used or stays locked for `patienceMs`.
    explicit Spool(int patienceMs);
    explicit operator bool() const { return static_cast<bool>(ledger_); }

    int ledger() const { return ledger_.get(); }
    bool full() const;
    bool put(const Notice& notice) const;
    // Takes the oldest notice out of the queue, so that a crash while it is delivered cannot repeat forever.
    std::optional<Notice> take() const;
    // One of the few permissions to deliver, held as long as the descriptor is open in any process.
    Descriptor freeSlot() const;

  private:
    Descriptor ledger_;
};

// worker.cpp

// Starts the process that delivers the queue. The slot passes to it; the caller's copy may be closed at once.
int StartWorker(const Descriptor& slot);

// channels.cpp

struct Channel {
    const char* name;
    bool (*configured)(const Settings& settings);
    // The cause of the failure; empty when it was delivered.
    std::string (*deliver)(const Settings& settings, const Notice& notice);
    const char* failure;  // what the system log says, followed by the cause
};

constexpr size_t kChannelCount = 3;
const std::array<Channel, kChannelCount>& Channels();

uint32_t ConfiguredChannels(const Settings& settings);
// The bits of a comma list of names; unknown names are ignored.
uint32_t ChannelsNamed(std::string_view names);
// Delivers on the notice's channels that are (still) configured; failures go to the system log.
void Deliver(const Notice& notice);
// Log content that holds one of our own failures must not set off another notice, which would fail again.
bool ReportsOwnFailure(const char* content);

// desktop.cpp, mail.cpp, webhook.cpp (without libcurl: nocurl.cpp)

std::string DeliverToDesktop(const Settings& settings, const Notice& notice);
std::string DeliverByMail(const Settings& settings, const Notice& notice);
std::string DeliverToWebhooks(const Settings& settings, const Notice& notice);

// message.cpp

std::string NoticeAsJson(const Notice& notice);
std::string NoticeAsMail(const QUORMAIL& mail, const Notice& notice);
// The recipients; text that cannot be an address is left out.
std::vector<std::string> Recipients(const QUORMAIL& mail);
std::string Sender(const QUORMAIL& mail);

// text.cpp

// The bytes of the character that a text begins with, 0 when it does not begin with one.
size_t Utf8Length(std::string_view text);
bool IsUtf8(std::string_view text);
std::string JsonText(std::string_view text);  // with its quotes, always valid JSON
std::string Base64(std::string_view bytes);
// Control characters become blanks, other invalid bytes U+FFFD; cut at a character's end to fit `size`.
std::string OneLine(std::string_view text, size_t size);
std::vector<std::string> Words(std::string_view text, std::string_view separators);

}  // namespace quor::notify

#endif
