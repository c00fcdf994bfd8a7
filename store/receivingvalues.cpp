#include "store/receivingvalues.h"

#include <algorithm>
#include <filesystem>
#include <functional>
#include <set>
#include <string_view>

#include "base/numbers.h"
#include "base/textfile.h"
#include "base/words.h"

namespace quor::store {
namespace {

// In the order in which syslog-ng includes them.
std::set<std::string> valueFiles(const std::string& folder) {
    std::set<std::string> files;
    std::error_code none;
    for (const auto& entry : std::filesystem::directory_iterator(folder, none)) {
        const std::string name = entry.path().filename();
        if (name.rfind("receiving", 0) == 0 && entry.path().extension() == ".conf") {
            files.insert(entry.path());
        }
    }
    return files;
}

// A line reads @define NAME "VALUE".
void eachDefinition(const std::string& file, const std::function<void(const std::string&, const std::string&)>& take) {
    constexpr size_t kMostBytes = 1U << 20U;
    std::string text;
    (void)ReadTextFile(file, kMostBytes, text);
    EachWord(text, "\n", [&](std::string_view line) {
        std::vector<std::string> words;
        EachWord(line, " \t\r\"'", [&](std::string_view word) { words.emplace_back(word); });
        if (words.size() >= 3 && words[0] == "@define") {
            take(words[1], words[2]);
        }
    });
}

void set(uint16_t& port, const std::string& value) {
    const uint64_t number = ToUint64(value.c_str());
    port = number == 0 || number > UINT16_MAX ? port : static_cast<uint16_t>(number);
}

}  // namespace

std::vector<uint16_t> ReceivingValues::tcpPorts() const {
    std::vector<uint16_t> ports = {port, framedPort};
    if (tls) {
        ports.push_back(tlsPort);
    }
    return ports;
}

ReceivingValues ReadReceivingValues(const std::string& folder) {
    ReceivingValues values;
    const auto take = [&values](const std::string& name, const std::string& value) {
        if (name == "quor_port") {
            set(values.port, value);
        } else if (name == "quor_port_framed") {
            set(values.framedPort, value);
        } else if (name == "quor_port_tls") {
            set(values.tlsPort, value);
        } else if (name == "quor_tls") {
            values.tls = value == "on";
        } else if (name == "quor_connections") {
            values.connections = std::max<uint64_t>(ToUint64(value.c_str()), 1);
        }
    };
    for (const std::string& file : valueFiles(folder)) {
        eachDefinition(file, take);
    }
    return values;
}

}  // namespace quor::store
