#include "platform/salvage/pages.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iterator>
#include <utility>

#include "platform/salvage/cells.h"

namespace quor::salvage {
namespace {

constexpr char kMagic[] = "SQLite format 3";  // with its zero byte
constexpr size_t kHeader = 100;
constexpr uint32_t kSmallestPage = 512;
constexpr uint32_t kLargestPage = 65536;
constexpr size_t kLogHeader = 32;
constexpr size_t kFrameHeader = 24;
constexpr uint32_t kLogMagic = 0x377f0682;  // the lowest bit tells the byte order of the sums
constexpr uint32_t kSamples = 512;

bool isPageSize(uint32_t size) {
    return size >= kSmallestPage && size <= kLargestPage && (size & (size - 1)) == 0;
}

// The running sums of the write-ahead log over a multiple of eight bytes.
void addSums(const uint8_t* data, size_t size, bool bigEndian, uint32_t& sum1, uint32_t& sum2) {
    const auto word = [bigEndian](const uint8_t* at) { return bigEndian ? Big32(at) : __builtin_bswap32(Big32(at)); };
    for (size_t i = 0; i + 8 <= size; i += 8) {
        sum1 += word(data + i) + sum2;
        sum2 += word(data + i + 4) + sum1;
    }
}

}  // namespace

bool InputFile::open(const std::string& path) {
    file_ = Descriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status {};
    if (!file_ || fstat(file_.get(), &status) != 0 || !S_ISREG(status.st_mode)) {
        return false;
    }
    size_ = static_cast<uint64_t>(status.st_size);
    return true;
}

size_t InputFile::read(uint64_t offset, uint8_t* out, size_t size) const {
    size_t done = 0;
    while (done < size) {
        const ssize_t got = pread(file_.get(), out + done, size - done, static_cast<off_t>(offset + done));
        if (got == 0 || (got < 0 && errno != EINTR)) {
            break;
        }
        done += got > 0 ? static_cast<size_t>(got) : 0;
    }
    return done;
}

bool PageFile::open(const std::string& path) {
    if (!file_.open(path)) {
        return false;
    }
    readHeader();
    readLog(path + "-wal");
    if (pageSize_ == 0) {
        guessPageSize();
    }
    if (pageSize_ == 0) {
        return false;
    }
    const uint64_t inFile = file_.size() / pageSize_;
    count_ = std::max(count_, static_cast<uint32_t>(std::min<uint64_t>(inFile, UINT32_MAX - 1)));
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
    const uint32_t size = Big16(header + 16) == 1 ? kLargestPage : Big16(header + 16);
    if (!isPageSize(size) || size - header[20] < 480) {
        return;
    }
    pageSize_ = size;
    reserved_ = header[20];
    encoding_ = std::clamp(Big32(header + 56), 1U, 3U);
    headerRead_ = true;
}

// Takes the log only when its header is whole and it has the page size of the database.
void PageFile::readLog(const std::string& path) {
    uint8_t header[kLogHeader] = {};
    if (!log_.open(path) || log_.read(0, header, sizeof header) != sizeof header) {
        return;
    }
    const bool bigEndian = Big32(header) == (kLogMagic | 1U);
    const uint32_t size = Big32(header + 8);
    uint32_t sum1 = 0;
    uint32_t sum2 = 0;
    addSums(header, kFrameHeader, bigEndian, sum1, sum2);
    if ((Big32(header) | 1U) != (kLogMagic | 1U) || !isPageSize(size) || (pageSize_ != 0 && pageSize_ != size) ||
        sum1 != Big32(header + 24) || sum2 != Big32(header + 28)) {
        return;
    }
    pageSize_ = size;
    readFrames(bigEndian, sum1, sum2);
}

// Frames count up to the last one that ends a transaction; the first with another salt or sum is left from before.
void PageFile::readFrames(bool bigEndian, uint32_t sum1, uint32_t sum2) {
    Bytes frame(kFrameHeader + pageSize_);
    uint8_t salt[8];
    log_.read(16, salt, sizeof salt);
    std::vector<std::pair<uint32_t, uint64_t>> open;
    for (uint64_t at = kLogHeader; log_.read(at, frame.data(), frame.size()) == frame.size(); at += frame.size()) {
        addSums(frame.data(), 8, bigEndian, sum1, sum2);
        addSums(frame.data() + kFrameHeader, pageSize_, bigEndian, sum1, sum2);
        if (memcmp(frame.data() + 8, salt, sizeof salt) != 0 || sum1 != Big32(frame.data() + 16) ||
            sum2 != Big32(frame.data() + 20)) {
            break;
        }
        open.emplace_back(Big32(frame.data()), at + kFrameHeader);
        const uint32_t pages = Big32(frame.data() + 4);  // of the database, in the last frame of a transaction
        if (pages == 0) {
            continue;
        }
        count_ = std::max(count_, std::min(pages, UINT32_MAX - 1));
        for (const auto& [page, place] : open) {
            frames_[page] = place;
        }
        open.clear();
    }
}

// The right size is the one with which the most bytes are leaf pages filled to their end.
void PageFile::guessPageSize() {
    constexpr size_t kSizes = 8;  // 512 to 65536
    uint64_t fitting[kSizes] = {};
    Bytes window(kLargestPage);
    const uint64_t step = std::max<uint64_t>(1, file_.size() / kLargestPage / kSamples) * kLargestPage;
    for (uint64_t at = 0; at < file_.size(); at += step) {
        const size_t got = file_.read(at, window.data(), window.size());
        for (size_t i = 0; i < kSizes; ++i) {
            const size_t size = size_t{kSmallestPage} << i;
            for (size_t page = 0; page + size <= got; page += size) {
                fitting[i] += IsFullLeaf(window.data() + page, size) ? size : 0;
            }
        }
    }
    const uint64_t* best = std::max_element(std::begin(fitting), std::end(fitting));
    pageSize_ = *best > 0 ? kSmallestPage << (best - fitting) : 0;
}

bool PageFile::read(uint32_t number, Bytes& page) const {
    if (number == 0 || number > count_) {
        return false;
    }
    page.resize(pageSize_);
    const auto frame = frames_.find(number);
    const bool logged = frame != frames_.end();
    const InputFile& source = logged ? log_ : file_;
    const uint64_t offset = logged ? frame->second : uint64_t{number - 1} * pageSize_;
    return source.read(offset, page.data(), pageSize_) == pageSize_;
}

}  // namespace quor::salvage
