#include "store/connections.h"

#include <arpa/inet.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cstring>
#include <fstream>
#include <optional>
#include <set>
#include <string_view>

#include "base/numbers.h"
#include "base/words.h"

namespace quor::store {
namespace {

// One line of /proc/net/tcp or tcp6. The address is one or four words of eight digits, each a number in the byte order
// of this machine.
struct Socket {
    uint16_t port;
    std::string_view sender;
    std::string_view state;
};

template <typename Number>
Number hexadecimal(std::string_view digits) {
    Number number = 0;
    (void)std::from_chars(digits.data(), digits.data() + digits.size(), number, 16);  // what is none is 0
    return number;
}

std::optional<Socket> parseSocket(std::string_view line) {
    std::vector<std::string_view> words;
    EachWord(line, " :", [&](std::string_view word) { words.push_back(word); });
    if (words.size() < 6 || words[3].size() % 8 != 0) {
        return std::nullopt;
    }
    return Socket{hexadecimal<uint16_t>(words[2]), words[3], words[5]};
}

std::string addressOf(std::string_view digits) {
    std::array<uint32_t, 4> words{};
    for (size_t i = 0; i < words.size() && (i + 1) * 8 <= digits.size(); ++i) {
        words[i] = hexadecimal<uint32_t>(digits.substr(i * 8, 8));
    }
    in6_addr address{};
    memcpy(&address, words.data(), sizeof address);
    const bool mapped = IN6_IS_ADDR_V4MAPPED(&address);
    std::array<char, INET6_ADDRSTRLEN> text{};
    const bool four = digits.size() == 8 || mapped;
    const void* bytes = mapped ? &address.s6_addr[12] : static_cast<const void*>(&address);
    return OrEmpty(inet_ntop(four ? AF_INET : AF_INET6, bytes, text.data(), text.size()));
}

bool isOpen(const Socket& socket) {
    constexpr std::string_view kEstablished = "01";
    constexpr std::string_view kClosedByThem = "08";
    return socket.state == kEstablished || socket.state == kClosedByThem;
}

using Senders = std::map<std::string, uint64_t>;  // the connections of each address

PortUse useOf(const Senders& senders) {
    PortUse use;
    for (const auto& [address, count] : senders) {
        use.connections += count;
        if (count > use.busiestHolds) {
            use.busiest = address;
            use.busiestHolds = count;
        }
    }
    return use;
}

}  // namespace

std::map<uint16_t, PortUse> UseOfPorts(const std::vector<uint16_t>& ports) {
    std::set<uint16_t> listening;
    std::map<uint16_t, Senders> connected;
    for (const char* table : {"/proc/net/tcp", "/proc/net/tcp6"}) {
        std::ifstream lines(table);
        for (std::string line; std::getline(lines, line);) {
            const std::optional<Socket> socket = parseSocket(line);
            if (!socket || std::find(ports.begin(), ports.end(), socket->port) == ports.end()) {
                continue;
            }
            if (socket->state == "0A") {
                listening.insert(socket->port);
            } else if (isOpen(*socket)) {
                ++connected[socket->port][addressOf(socket->sender)];
            }
        }
    }
    std::map<uint16_t, PortUse> uses;
    for (const uint16_t port : listening) {
        uses[port] = useOf(connected[port]);
    }
    return uses;
}

bool IsCrowded(const PortUse& use, uint64_t most) {
    return use.connections >= most - most / 10;
}

}  // namespace quor::store
