// Looking for alpha.
#include "files/alpha_in_use.h"

#include <cstring>

namespace zq {

namespace {

template <class Channel>
bool row_has_alpha(const std::uint8_t* row, std::int32_t width) {
    Channel all = 0;
    for (std::int32_t x = 0; x < width; ++x) {
        Channel alpha;
        std::memcpy(&alpha,
                    row + (std::size_t{4} * static_cast<std::size_t>(x) + 3) * sizeof(Channel),
                    sizeof(alpha));
        all = static_cast<Channel>(all | alpha);
    }
    return all != 0;
}

}  // namespace

bool has_alpha(const PixelView& pixels) {
    const bool colour = pixels.type == PixelType::kRgb || pixels.type == PixelType::kRgbU64;
    if (!colour || pixels.packing != Packing::kNative) return false;
    const auto row_test = pixels.type == PixelType::kRgbU64 ? row_has_alpha<std::uint16_t>
                                                            : row_has_alpha<std::uint8_t>;
    for (std::int32_t y = 0; y < pixels.height; ++y) {
        if (row_test(pixels.row(y), pixels.width)) return true;
    }
    return false;
}

}  // namespace zq
