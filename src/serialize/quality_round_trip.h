// What JPEG brings back of a picture at one quality after another. The streams themselves are left
// out: nothing is lost in them, and they would take most of the time.
#pragma once

#include <cstdint>
#include <span>
#include <vector>

#include "image/image.h"

namespace zq {

// Eight lines of a picture, in blocks.
struct JpegBandShape {
    std::size_t planes;
    std::size_t blocks;  // side by side

    explicit JpegBandShape(const Image& picture);
    // Of a band, plane by plane.
    std::size_t coefficients() const;
};

class JpegRoundTrip {
  public:
    // U8 or RGB, with pixels; they are not needed afterwards.
    explicit JpegRoundTrip(const Image& picture);

    // Into an image of the same type and size, whose alpha becomes 0.
    void decode(int quality, const Image& result) const;

  private:
    JpegBandShape shape_;
    std::vector<std::int16_t> coefficients_;  // band by band
};

// The squared error of a picture at each of several qualities. A band at a time, so that nothing of
// the picture's size is needed.
std::vector<double> squared_errors(const Image& picture, std::span<const int> qualities);

}  // namespace zq
