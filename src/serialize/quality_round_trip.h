// What JPEG brings back of a picture at one quality after another. The streams themselves are left
// out: nothing is lost in them, and they would take most of the time.
#pragma once

#include <cstdint>
#include <vector>

#include "image/image.h"

namespace zq {

class JpegRoundTrip {
  public:
    // U8 or RGB, with pixels; they are not needed afterwards.
    explicit JpegRoundTrip(const Image& picture);

    // Into an image of the same type and size, whose alpha becomes 0.
    void decode(int quality, const Image& result) const;

  private:
    const std::int16_t* coefficients_of(std::size_t band, std::size_t plane) const;

    std::size_t planes_;
    std::size_t blocks_;                      // side by side
    std::vector<std::int16_t> coefficients_;  // band by band, each plane by plane
};

}  // namespace zq
