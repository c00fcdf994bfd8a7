// The pages of a table's tree.
#ifndef PLATFORM_SALVAGE_TREE_H
#define PLATFORM_SALVAGE_TREE_H

#include <cstddef>
#include <cstdint>
#include <vector>

#include "platform/salvage/pages.h"

namespace quor::salvage {

class TreePage {
  public:
    // `page` must outlive this; page 1 starts with the header of the file.
    TreePage(const Bytes& page, uint32_t number, uint32_t usable);

    bool isLeaf() const;
    bool isInterior() const;
    uint32_t cells() const { return cells_; }
    // Where a cell stands; 0 when its pointer is wrong.
    uint32_t cell(uint32_t index) const;
    // Pages below an interior page, in order; 0 for one whose pointer is wrong.
    std::vector<uint32_t> children() const;

  private:
    const Bytes& page_;
    uint32_t usable_;
    uint32_t pointers_ = 0;
    uint32_t cells_ = 0;
    uint8_t type_ = 0;
};

// Whether these bytes are a leaf page of a table whose cells reach to its end.
bool IsFullLeaf(const uint8_t* page, size_t size);

}  // namespace quor::salvage

#endif
