#include "platform/salvage/tree.h"

#include <algorithm>
#include <optional>

#include "platform/salvage/cells.h"

namespace quor::salvage {
namespace {

constexpr uint8_t kLeaf = 0x0d;
constexpr uint8_t kInterior = 0x05;
constexpr uint32_t kFileHeader = 100;
constexpr uint32_t kLeafHeader = 8;
constexpr uint32_t kInteriorHeader = 12;

}  // namespace

TreePage::TreePage(const Bytes& page, uint32_t number, uint32_t usable) : page_(page), usable_(usable) {
    const uint32_t start = number == 1 ? kFileHeader : 0;
    const uint8_t type = page[start];
    const uint32_t header = type == kInterior ? kInteriorHeader : kLeafHeader;
    const uint32_t cells = Big16(page.data() + start + 3);
    pointers_ = start + header;
    if ((type == kLeaf || type == kInterior) && pointers_ + 2 * cells <= usable) {
        type_ = type;
        cells_ = cells;
    }
}

bool TreePage::isLeaf() const {
    return type_ == kLeaf;
}

bool TreePage::isInterior() const {
    return type_ == kInterior;
}

uint32_t TreePage::cell(uint32_t index) const {
    const uint32_t offset = Big16(page_.data() + pointers_ + size_t{2} * index);
    return offset >= pointers_ + 2 * cells_ && offset + 4 <= usable_ ? offset : 0;
}

std::vector<uint32_t> TreePage::children() const {
    std::vector<uint32_t> pages;
    for (uint32_t i = 0; i < cells_; ++i) {
        pages.push_back(cell(i) != 0 ? Big32(page_.data() + cell(i)) : 0);
    }
    pages.push_back(Big32(page_.data() + pointers_ - 4));
    return pages;
}

bool IsFullLeaf(const uint8_t* page, size_t size) {
    const uint32_t cells = Big16(page + 3);
    if (page[0] != kLeaf || cells == 0 || kLeafHeader + size_t{2} * cells > size) {
        return false;
    }
    const uint8_t* furthest = page;
    for (uint32_t i = 0; i < cells; ++i) {
        const uint32_t offset = Big16(page + kLeafHeader + size_t{2} * i);
        const std::optional<Cell> cell = ReadCell(page, offset, static_cast<uint32_t>(size));
        if (offset < kLeafHeader || !cell) {
            return false;
        }
        furthest = std::max(furthest, cell->end);
    }
    return furthest == page + size;
}

}  // namespace quor::salvage
