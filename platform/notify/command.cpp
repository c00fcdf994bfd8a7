// An administrator's program as a channel. It runs as who sends the notice, so nobody else may be able to change it.
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

#include "base/files.h"
#include "platform/notify/delivery.h"
#include "platform/notify/message.h"
#include "platform/notify/oneline.h"
#include "platform/notify/program.h"

namespace quor::notify {
namespace {

constexpr int kGiveUp = 100;  // the exit status of a program that will not take this notice, however often

// Why others could put something else in the place of a file or folder; empty when they cannot.
std::string changeable(const std::string& path) {
    struct stat found {};
    if (lstat(path.c_str(), &found) != 0) {
        return path + ": " + strerror(errno);
    }
    const bool ours = found.st_uid == 0 || found.st_uid == geteuid();
    const bool writable = (found.st_mode & (S_IWGRP | S_IWOTH)) != 0;
    const bool ownersOnly = S_ISDIR(found.st_mode) && (found.st_mode & S_ISVTX) != 0;
    return ours && (!writable || ownersOnly)
               ? ""
               : path + " can be changed by others; run: chown root " + path + " && chmod go-w " + path;
}

// A link is refused, since each on the way to the file would have to be looked at as well.
std::string whyNot(const std::string& program) {
    if (program.front() != '/') {
        return "notify_command must be an absolute path";
    }
    const CText real(realpath(program.c_str(), nullptr));
    if (!real) {
        return program + ": " + strerror(errno) + "; set notify_command to a program that is there";
    }
    if (program != real.get()) {
        return std::string("set notify_command to the file that it leads to: ") + real.get();
    }
    std::string cause = changeable("/");
    for (size_t end = 0; cause.empty() && end != std::string::npos;) {
        end = program.find('/', end + 1);
        cause = changeable(program.substr(0, end));
    }
    return cause.empty() && access(program.c_str(), X_OK) != 0 ? program + " cannot be run; run: chmod +x " + program
                                                               : cause;
}

// A file, which a program need not read; null, with the cause in errno, when there is no room for it.
File inputWith(const std::string& text) {
    File file(tmpfile());
    const bool written = file && WriteAll(fileno(file.get()), text) && lseek(fileno(file.get()), 0, SEEK_SET) == 0;
    return written ? std::move(file) : nullptr;
}

// What is not ours stays out: some programs take a variable for a command.
std::vector<std::string> environmentOf(const Notice& notice) {
    return {"PATH=/usr/sbin:/usr/bin:/sbin:/bin",
            "LANG=C.UTF-8",
            "HOME=/",
            "NOTICE_TAG=" + notice.tag,
            "NOTICE_TIME=" + std::to_string(notice.time),
            "NOTICE_SUPPRESSED=" + std::to_string(notice.heldBack)};
}

std::string causeOf(const ProgramEnd& end, int32_t seconds) {
    const std::string said = end.output.empty() ? "" : "; it said: " + OneLine(end.output, 200);
    if (!end.inTime) {
        return "the command took longer than " + std::to_string(seconds) +
               " seconds and was ended; make it faster, or set notify_timeout" + said;
    }
    if (WIFSIGNALED(end.status)) {
        return "the command was ended by signal " + std::to_string(WTERMSIG(end.status)) + said;
    }
    const int status = WEXITSTATUS(end.status);
    return status == 0 ? "" : "the command ended with status " + std::to_string(status) + said;
}

}  // namespace

Outcome DeliverToCommand(const Settings& settings, const Notice& notice) {
    const std::string fault = whyNot(settings.command);
    if (!fault.empty()) {
        return {fault};
    }
    const File input = inputWith(NoticeAsJson(notice) + "\n");
    const auto end = input ? RunProgram(settings.command, environmentOf(notice), fileno(input.get()), settings.timeout)
                           : std::nullopt;
    if (!end) {
        return {std::string("the command cannot be started: ") + strerror(errno)};
    }
    return {causeOf(*end, settings.timeout), WIFEXITED(end->status) && WEXITSTATUS(end->status) == kGiveUp};
}

}  // namespace quor::notify
