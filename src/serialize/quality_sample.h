// What qualities are tried on.
#pragma once

#include <cstdint>

#include "image/image.h"

namespace zq {

inline std::int64_t pixels_of(const Image& image) {
    return std::int64_t{image.record().width} * image.record().height;
}

// The image itself, or a small picture of parts of it: for JPEG four strips of whole blocks, spread
// from the top left to the bottom right; else one rectangle from the middle. Borrows the image.
class QualitySample {
  public:
    // Images of up to `most_whole` pixels are taken as a whole.
    QualitySample(const Image& image, std::int64_t most_whole);

    bool is_whole() const { return is_whole_; }
    const Image& picture() const { return is_whole_ ? image_ : part_; }
    // In the image, of a pixel of the picture.
    std::uint64_t index_of(std::int32_t x, std::int32_t y) const;

  private:
    struct Corner {
        std::int32_t x, y;
    };
    Corner corner_of(std::int32_t strip) const;
    void copy() const;

    const Image& image_;
    Image part_;
    bool is_whole_ = true;
    std::int32_t strips_ = 1;
    std::int32_t strip_height_ = 1;
};

}  // namespace zq
