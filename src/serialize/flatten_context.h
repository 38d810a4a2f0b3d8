// The flatten context: what lies between an image and a record, with the blocks that it points at.
#pragma once

#include <zqvissvc/flatten.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "base/checked.h"

namespace zq {

// A context that is being filled, and its blocks. The pixel block may lie in the image's own
// memory; the image must then stay locked and as it is.
class FlattenContext {
  public:
    FlattenContext() = default;
    FlattenContext(const FlattenContext&) = delete;
    FlattenContext& operator=(const FlattenContext&) = delete;

    ZqFlattenContext words{};

    void own_pixels(std::vector<std::uint8_t> block) {
        pixels_ = std::move(block);
        borrow_pixels(pixels_, pixels_.size());
    }
    // The block is `size` bytes long; those that `readable` does not have are zeros.
    void borrow_pixels(std::span<const std::uint8_t> readable, std::size_t size) {
        words.pixelBlockSize = checked_narrow<std::uint32_t>(size);
        words.pixelBlock = readable.data();
        readable_ = readable.first(std::min(readable.size(), size));
    }
    std::span<const std::uint8_t> readable_pixels() const { return readable_; }

    void own_attachment(std::vector<std::uint8_t> block) {
        attachment_ = std::move(block);
        words.attachmentBlockSize = checked_narrow<std::uint32_t>(attachment_.size());
        words.attachmentBlock = attachment_.data();
    }
    void own_properties(std::vector<std::uint8_t> block) {
        properties_ = std::move(block);
        words.propertyBlockSize = checked_narrow<std::uint32_t>(properties_.size());
        words.propertyBlock = properties_.data();
    }

  private:
    std::vector<std::uint8_t> pixels_, attachment_, properties_;
    std::span<const std::uint8_t> readable_;
};

// A block of a context as bytes. Throws kNullPointer when there should be some and are none.
inline std::span<const std::uint8_t> block_bytes(const void* block, std::uint32_t size) {
    if (block == nullptr && size != 0) throw kNullPointer;
    return {static_cast<const std::uint8_t*>(block), size};
}

}  // namespace zq
