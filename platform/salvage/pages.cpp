#include "platform/salvage/pages.h"

#include <algorithm>
#include <array>
#include <cstring>

#include "platform/salvage/cells.h"
#include "platform/salvage/tree.h"

namespace quor::salvage {
namespace {

constexpr char kMagic[] = "SQLite format 3";  // with its zero byte
constexpr size_t kHeader = 100;
constexpr uint32_t kSmallestUsable = 480;
constexpr std::array<uint32_t, 8> kPageSizes{512, 1024, 2048, 4096, 8192, 16384, 32768, 65536};
constexpr uint32_t kLargestPage = kPageSizes.back();
constexpr uint32_t kSamples = 512;

// Bytes of `window` that are leaf pages of that size filled to their end.
uint64_t bytesOfLeaves(const uint8_t* window, size_t windowSize, size_t pageSize) {
    uint64_t bytes = 0;
    for (size_t at = 0; at + pageSize <= windowSize; at += pageSize) {
        bytes += IsFullLeaf(window + at, pageSize) ? pageSize : 0;
    }
    return bytes;
}

}  // namespace

bool PageFile::open(const std::string& path) {
    if (!file_.open(path)) {
        return false;
    }
    readHeader();
    log_.open(path + "-wal", pageSize_);
    pageSize_ = pageSize_ != 0 ? pageSize_ : log_.pageSize();
    if (pageSize_ == 0) {
        guessPageSize();
    }
    if (pageSize_ == 0) {
        return false;
    }
    const uint64_t inFile = std::min<uint64_t>(file_.size() / pageSize_, UINT32_MAX - 1);
    count_ = std::max(log_.pages(), static_cast<uint32_t>(inFile));
    Bytes first;
    if (headerRead_ && read(1, first)) {
        firstFree_ = Big32(first.data() + 32);
    }
    return true;
}

void PageFile::readHeader() {
    uint8_t header[kHeader] = {};
    if (file_.read(0, header, sizeof header) != sizeof header || memcmp(header, kMagic, sizeof kMagic) != 0) {
        return;
    }
    const uint32_t size = Big16(header + 16) == 1 ? kLargestPage : Big16(header + 16);  // which 16 bits cannot hold
    const uint32_t reserved = header[20];
    if (!IsPageSize(size) || size - reserved < kSmallestUsable) {
        return;
    }
    pageSize_ = size;
    reserved_ = reserved;
    encoding_ = std::clamp(Big32(header + 56), 1U, 3U);
    headerRead_ = true;
}

// The right size is the one with which the most bytes are leaf pages filled to their end.
void PageFile::guessPageSize() {
    std::array<uint64_t, kPageSizes.size()> fitting{};
    Bytes window(kLargestPage);
    const uint64_t step = std::max<uint64_t>(1, file_.size() / kLargestPage / kSamples) * kLargestPage;
    for (uint64_t at = 0; at < file_.size(); at += step) {
        const size_t got = file_.read(at, window.data(), window.size());
        for (size_t i = 0; i < kPageSizes.size(); ++i) {
            fitting[i] += bytesOfLeaves(window.data(), got, kPageSizes[i]);
        }
    }
    const auto* const best = std::max_element(fitting.begin(), fitting.end());
    pageSize_ = *best > 0 ? kPageSizes[static_cast<size_t>(best - fitting.begin())] : 0;
}

bool PageFile::read(uint32_t number, Bytes& page) const {
    if (number == 0 || number > count_) {
        return false;
    }
    page.resize(pageSize_);
    if (log_.has(number)) {
        return log_.read(number, page.data());
    }
    return file_.read(uint64_t{number - 1} * pageSize_, page.data(), pageSize_) == pageSize_;
}

}  // namespace quor::salvage
