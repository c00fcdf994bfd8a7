#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>

#include "base/files.h"
#include "base/paths.h"
#include "platform/notify/delivery.h"
#include "platform/notify/message.h"
#include "platform/notify/spool.h"

namespace quor::notify {
namespace {

constexpr const char kFile[] = "/desktop.jsonl";
constexpr off_t kMostBytes = off_t{1} << 20U;

std::string append(const std::string& path, const std::string& line) {
    const Descriptor file(open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    return file && WriteAll(file.get(), line) ? "" : path + ": " + strerror(errno);
}

}  // namespace

// When the file has grown to its bound it becomes "desktop.jsonl.1", in place of the one before.
Outcome DeliverToDesktop(const Settings& /*settings*/, const Notice& notice) {
    const Spool spool(kWaitForever);
    const std::string path = std::string(paths::kNotifySpool) + kFile;
    struct stat found {};
    if (stat(path.c_str(), &found) == 0 && found.st_size >= kMostBytes) {
        (void)rename(path.c_str(), (path + ".1").c_str());
    }
    return {append(path, NoticeAsJson(notice) + "\n")};
}

}  // namespace quor::notify
