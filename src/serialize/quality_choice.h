// What a quality makes of a picture, tried out before it is used. Coarse steps on drawn patterns,
// small pictures or soft ones may leave neighbouring qualities equal, or a higher one behind a
// lower; the trial finds out, and says where single pixels are worth telling exactly.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "image/image.h"
#include "serialize/quality_stream.h"
#include "serialize/quality_touches.h"

namespace zq {

struct QualityChoice {
    int quality;                              // the one whose steps are to be used
    std::optional<Bytes> payload;             // of the whole image, when the trial has made it
    std::vector<PixelError> errors;           // of some pixels or all, as they will come back
    std::vector<std::uint64_t> crossed_hues;  // of the whole payload, where there is one
};

// `quality`, or a lower one that comes out truer. Images of up to 2^17 pixels are tried as they
// are, larger ones by samples; docs/quality-codec.md says by which.
QualityChoice choose_quality(const Image& image, int quality);

}  // namespace zq
