// Display texts of the pixel types.
#include "image/pixel_type.h"

namespace zq {

const char* display_text(std::int32_t code) {
    static constexpr std::array<const char*, 7> kTexts = {
        "8 bits", "16 bits", "Float", "Complex", "RGB", "HSL", "RGB (U64)"};
    return is_pixel_type(code) ? kTexts[static_cast<std::size_t>(code)] : "Unknown";
}

}  // namespace zq
