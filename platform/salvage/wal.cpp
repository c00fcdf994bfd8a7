#include "platform/salvage/wal.h"

#include <algorithm>
#include <cstring>

#include "platform/salvage/cells.h"

namespace quor::salvage {
namespace {

constexpr size_t kHeader = 32;
constexpr size_t kFrameHeader = 24;
constexpr uint32_t kMagic = 0x377f0682;
constexpr uint32_t kBigEndian = 1;  // the bit of the magic number that tells the byte order of the sums

}  // namespace

// The sums that run through the whole log.
class WriteAheadLog::Sums {
  public:
    explicit Sums(bool bigEndian) : bigEndian_(bigEndian) {}

    // A multiple of eight bytes.
    void add(const uint8_t* data, size_t size) {
        for (size_t i = 0; i + 8 <= size; i += 8) {
            first_ += word(data + i) + second_;
            second_ += word(data + i + 4) + first_;
        }
    }
    bool stand(const uint8_t* at) const { return Big32(at) == first_ && Big32(at + 4) == second_; }

  private:
    uint32_t word(const uint8_t* at) const { return bigEndian_ ? Big32(at) : __builtin_bswap32(Big32(at)); }

    bool bigEndian_;
    uint32_t first_ = 0;
    uint32_t second_ = 0;
};

void WriteAheadLog::open(const std::string& path, uint32_t pageSize) {
    uint8_t header[kHeader] = {};
    if (!file_.open(path) || file_.read(0, header, sizeof header) != sizeof header) {
        return;
    }
    const uint32_t magic = Big32(header);
    const uint32_t size = Big32(header + 8);
    Sums sums(magic == (kMagic | kBigEndian));
    sums.add(header, 24);
    const bool whole = (magic & ~kBigEndian) == kMagic && IsPageSize(size) && sums.stand(header + 24);
    if (whole && (pageSize == 0 || pageSize == size)) {
        pageSize_ = size;
        readFrames(sums);
    }
}

// Frames count up to the last one that ends a transaction; the first with another salt or sum is left from before.
void WriteAheadLog::readFrames(Sums sums) {
    std::vector<uint8_t> frame(kFrameHeader + pageSize_);
    uint8_t salt[8];
    file_.read(16, salt, sizeof salt);
    std::vector<std::pair<uint32_t, uint64_t>> unfinished;
    for (uint64_t at = kHeader; file_.read(at, frame.data(), frame.size()) == frame.size(); at += frame.size()) {
        sums.add(frame.data(), 8);
        sums.add(frame.data() + kFrameHeader, pageSize_);
        if (memcmp(frame.data() + 8, salt, sizeof salt) != 0 || !sums.stand(frame.data() + 16)) {
            break;
        }
        unfinished.emplace_back(Big32(frame.data()), at + kFrameHeader);
        const uint32_t pages = Big32(frame.data() + 4);
        if (pages != 0) {
            commit(unfinished, pages);
            unfinished.clear();
        }
    }
}

// The last frame of a transaction tells how many pages the database has from then on.
void WriteAheadLog::commit(const std::vector<std::pair<uint32_t, uint64_t>>& frames, uint32_t pages) {
    pages_ = std::max(pages_, std::min(pages, UINT32_MAX - 1));
    for (const auto& [page, place] : frames) {
        places_[page] = place;
    }
}

bool WriteAheadLog::read(uint32_t page, uint8_t* out) const {
    return file_.read(places_.at(page), out, pageSize_) == pageSize_;
}

}  // namespace quor::salvage
