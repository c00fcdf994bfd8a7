#include "fuzz/fuzz.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>

// The system log of the machine is left alone.
extern "C" void syslog(int /*priority*/, const char* /*format*/, ...) {}

namespace quor::fuzz {
namespace {

class Scratch {
  public:
    Scratch() { std::filesystem::create_directories(path_); }
    Scratch(const Scratch&) = delete;
    Scratch& operator=(const Scratch&) = delete;
    ~Scratch() {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }
    std::string path_ =
        (std::filesystem::exists("/dev/shm") ? "/dev/shm/quor-fuzz-" : "/tmp/quor-fuzz-") + std::to_string(getpid());
};

}  // namespace

void Require(bool holds, const char* what) {
    if (!holds) {
        (void)fprintf(stderr, "does not hold: %s\n", what);
        abort();
    }
}

std::string ScratchPath(const std::string& name) {
    static const Scratch scratch;
    return scratch.path_ + "/" + name;
}

void WriteFile(const std::string& path, const std::string& bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
}

std::string ReadFile(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

std::string AnyText(FuzzedDataProvider& data, size_t longest) {
    return data.ConsumeBytesAsString(data.ConsumeIntegralInRange<size_t>(0, longest));
}

}  // namespace quor::fuzz
