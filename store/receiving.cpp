#include "store/receiving.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/un.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fstream>
#include <string_view>
#include <vector>

#include "base/guards.h"
#include "base/numbers.h"
#include "base/paths.h"
#include "base/words.h"

namespace quor::store {
namespace {

std::string readFile(const std::string& path) {
    std::ifstream file(path);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

struct Answer {
    std::string text;
    int process = 0;
};

std::optional<Answer> ask(const std::string& path, const std::string& question) {
    constexpr size_t kMostBytes = 4U << 20U;
    constexpr timeval kPatience{2, 0};
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    Descriptor connection(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    if (!connection || path.size() >= sizeof address.sun_path) {
        return std::nullopt;
    }
    memcpy(address.sun_path, path.c_str(), path.size());
    (void)setsockopt(connection.get(), SOL_SOCKET, SO_SNDTIMEO, &kPatience, sizeof kPatience);
    (void)setsockopt(connection.get(), SOL_SOCKET, SO_RCVTIMEO, &kPatience, sizeof kPatience);
    ucred other{};
    socklen_t size = sizeof other;
    if (connect(connection.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
        getsockopt(connection.get(), SOL_SOCKET, SO_PEERCRED, &other, &size) != 0 ||
        send(connection.get(), question.data(), question.size(), MSG_NOSIGNAL) < 0) {
        return std::nullopt;
    }
    const std::string_view end = "\n.\n";
    Answer answer{"", other.pid};
    std::array<char, 16384> piece{};
    while (answer.text.size() < kMostBytes &&
           (answer.text.size() < end.size() ||
            answer.text.compare(answer.text.size() - end.size(), end.size(), end) != 0)) {
        const ssize_t got = recv(connection.get(), piece.data(), piece.size(), 0);
        if (got <= 0) {
            return std::nullopt;
        }
        answer.text.append(piece.data(), static_cast<size_t>(got));
    }
    return answer;
}

std::vector<std::string> wordsOf(std::string_view line, const char* separators) {
    std::vector<std::string> words;
    EachWord(line, separators, [&](std::string_view word) { words.emplace_back(word); });
    return words;
}

ReceiverCounts parseCounts(const std::string& statistics, int process) {
    ReceiverCounts counts;
    counts.process = process;
    EachWord(statistics, "\n", [&](std::string_view line) {
        if (line.rfind("dst.sql;d_quor_database#", 0) != 0) {
            return;
        }
        counts.stores = true;
        const size_t number = line.rfind(';');
        const size_t kind = line.rfind(';', number - 1);
        const std::string_view name = line.substr(kind + 1, number - kind - 1);
        const uint64_t value = ToUint64(std::string(line.substr(number + 1)).c_str());
        counts.dropped += name == "dropped" ? value : 0;
        counts.queued += name == "queued" ? value : 0;
        counts.written += name == "written" ? value : 0;
    });
    return counts;
}

// Address and port are the second word, in hexadecimal; the number of the socket is the tenth, its drops the last.
void addUdpDrops(const std::string& table, unsigned port, std::map<uint64_t, uint64_t>& drops) {
    std::array<char, 8> ending{};
    (void)snprintf(ending.data(), ending.size(), ":%04X", port & 0xFFFFU);
    EachWord(table, "\n", [&](std::string_view line) {
        const std::vector<std::string> words = wordsOf(line, " ");
        if (words.size() >= 13 && words[1].size() > 5 && words[1].compare(words[1].size() - 5, 5, ending.data()) == 0) {
            drops[ToUint64(words[9].c_str())] = ToUint64(words[12].c_str());
        }
    });
}

}  // namespace

std::optional<ReceiverCounts> AskReceiver(const std::string& control) {
    const std::optional<Answer> answer = ask(control, "STATS\n");
    return answer ? std::optional(parseCounts(answer->text, answer->process)) : std::nullopt;
}

std::map<uint64_t, uint64_t> UdpDrops(unsigned port) {
    std::map<uint64_t, uint64_t> drops;
    for (const char* table : {"/proc/net/udp", "/proc/net/udp6"}) {
        addUdpDrops(readFile(table), port, drops);
    }
    return drops;
}

int FollowerProcess() {
    const Descriptor file(open(paths::kReceiverPid, O_RDONLY | O_CLOEXEC));
    struct flock held {};
    held.l_type = F_RDLCK;
    held.l_whence = SEEK_SET;
    // Asked, not taken: a quorlogd that starts in this moment would take us for another one.
    const bool runs = file && fcntl(file.get(), F_OFD_GETLK, &held) == 0 && held.l_type != F_UNLCK;
    return runs ? std::max(ToInt32(readFile(paths::kReceiverPid).c_str()), 0) : 0;  // others are groups to a signal
}

}  // namespace quor::store
